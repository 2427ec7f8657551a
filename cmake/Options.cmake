# What every target is compiled with.
set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_EXPORT_COMPILE_COMMANDS ON)

option(TAVISK_WERROR "Treat warnings as errors" OFF)
set(TAVISK_SANITIZE "" CACHE STRING "Sanitizers, as -fsanitize= takes them: address,undefined or thread")

add_compile_options(-Wall -Wextra -Wpedantic -Wconversion -Wsign-conversion -Wshadow -Wnull-dereference -Wformat=2)
if(TAVISK_WERROR)
  add_compile_options(-Werror)
endif()
if(TAVISK_SANITIZE)
  add_compile_options(-fsanitize=${TAVISK_SANITIZE} -fno-omit-frame-pointer)
  add_link_options(-fsanitize=${TAVISK_SANITIZE})
endif()

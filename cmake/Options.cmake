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

if(CMAKE_UNITY_BUILD)
  # Every source is an included file then: names of others are hidden in it, and its classes have members whose types are
  # from an unnamed namespace.
  add_compile_options(-Wno-shadow $<$<CXX_COMPILER_ID:GNU>:-Wno-subobject-linkage>)
endif()

# The same sources give the same bytes, whichever folder they are built in.
add_compile_options(-ffile-prefix-map=${PROJECT_SOURCE_DIR}=. -Wdate-time)

# A package build (build type None) brings hardening of its own, though not all of it.
include(CheckCXXCompilerFlag)
check_cxx_compiler_flag(-fcf-protection TAVISK_PROTECTS_JUMPS) # on some processors only
set(hardening -D_GLIBCXX_ASSERTIONS -fstack-clash-protection $<$<BOOL:${TAVISK_PROTECTS_JUMPS}>:-fcf-protection>)
add_compile_options("$<$<CONFIG:Release>:-D_FORTIFY_SOURCE=2;-fstack-protector-strong>")
add_compile_options("$<$<CONFIG:Release,None>:${hardening}>")
add_link_options("$<$<CONFIG:Release>:-Wl,-z,relro,-z,now>")

# A run is short: what it costs is mostly to be loaded, so that small is fast.
set(small -Os -ffunction-sections -fdata-sections)
add_compile_options("$<$<CONFIG:Release,None>:${small}>")
add_link_options("$<$<CONFIG:Release,None>:-Wl,--as-needed,-z,pack-relative-relocs>")

# check_pie_supported is what makes CMake link executables with -pie.
include(CheckPIESupported)
check_pie_supported()

if(TAVISK_SANITIZE)
  add_compile_options(-fsanitize=${TAVISK_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
  add_link_options(-fsanitize=${TAVISK_SANITIZE})
else()
  # Shared, the C++ library would double the time to start; of the static one only what is used is taken.
  add_link_options(-static-libstdc++ -static-libgcc -Wl,--gc-sections)
endif()

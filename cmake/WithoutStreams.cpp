// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include <cstdlib>

// The static pugixml is one object: for its XPath and its stream functions, which nothing here calls, the C++ library's
// streams with all their locales and libm would come along, a sixth of the program and a tenth of the time that it
// takes to start. In the copy that is linked, what only those functions ask for is this, and ends the program
// (src/CMakeLists.txt reads the lines below). Nothing else is linked with it in place of the library's functions: who
// uses those has them. Where a pointer has 32 bits most have other names, and the streams come along.
#define TAVISK_HAS_NO(symbol)                          \
  extern "C" [[noreturn]] void taviskHasNo##symbol() { \
    std::abort();                                      \
  }

TAVISK_HAS_NO(fmod)
TAVISK_HAS_NO(_ZNSi4readEPcl)
TAVISK_HAS_NO(_ZNSi5seekgElSt12_Ios_Seekdir)
TAVISK_HAS_NO(_ZNSi5seekgESt4fposI11__mbstate_tE)
TAVISK_HAS_NO(_ZNSi5tellgEv)
TAVISK_HAS_NO(_ZNSo5writeEPKcl)
TAVISK_HAS_NO(_ZNSt9basic_iosIcSt11char_traitsIcEE5clearESt12_Ios_Iostate)
TAVISK_HAS_NO(_ZNSt13basic_istreamIwSt11char_traitsIwEE4readEPwl)
TAVISK_HAS_NO(_ZNSt13basic_istreamIwSt11char_traitsIwEE5seekgElSt12_Ios_Seekdir)
TAVISK_HAS_NO(_ZNSt13basic_istreamIwSt11char_traitsIwEE5seekgESt4fposI11__mbstate_tE)
TAVISK_HAS_NO(_ZNSt13basic_istreamIwSt11char_traitsIwEE5tellgEv)
TAVISK_HAS_NO(_ZNSt13basic_ostreamIwSt11char_traitsIwEE5writeEPKwl)
TAVISK_HAS_NO(_ZNSt9basic_iosIwSt11char_traitsIwEE5clearESt12_Ios_Iostate)

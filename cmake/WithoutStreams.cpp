// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include <cstdlib>

// The static pugixml is one object: for its XPath and its stream functions, which nothing here calls, the C++ library's
// streams with all their locales and libm would come along, a sixth of the program and a tenth of the time that it
// takes to start. In a program that has this file, what only those functions ask for ends it. To use streams in such a
// program is an error of the linker, which then finds two definitions.
#define TAVISK_HAS_NO(name, symbol) \
  void name() asm(symbol);          \
  void name() {                     \
    std::abort();                   \
  }

namespace tavisk {

TAVISK_HAS_NO(remainder, "fmod")
TAVISK_HAS_NO(readBytes, "_ZNSi4readEPcl")
TAVISK_HAS_NO(seekBytes, "_ZNSi5seekgElSt12_Ios_Seekdir")
TAVISK_HAS_NO(seekBytesAt, "_ZNSi5seekgESt4fposI11__mbstate_tE")
TAVISK_HAS_NO(tellBytes, "_ZNSi5tellgEv")
TAVISK_HAS_NO(writeBytes, "_ZNSo5writeEPKcl")
TAVISK_HAS_NO(clearBytes, "_ZNSt9basic_iosIcSt11char_traitsIcEE5clearESt12_Ios_Iostate")
TAVISK_HAS_NO(readWide, "_ZNSt13basic_istreamIwSt11char_traitsIwEE4readEPwl")
TAVISK_HAS_NO(seekWide, "_ZNSt13basic_istreamIwSt11char_traitsIwEE5seekgElSt12_Ios_Seekdir")
TAVISK_HAS_NO(seekWideAt, "_ZNSt13basic_istreamIwSt11char_traitsIwEE5seekgESt4fposI11__mbstate_tE")
TAVISK_HAS_NO(tellWide, "_ZNSt13basic_istreamIwSt11char_traitsIwEE5tellgEv")
TAVISK_HAS_NO(writeWide, "_ZNSt13basic_ostreamIwSt11char_traitsIwEE5writeEPKwl")
TAVISK_HAS_NO(clearWide, "_ZNSt9basic_iosIwSt11char_traitsIwEE5clearESt12_Ios_Iostate")

}  // namespace tavisk

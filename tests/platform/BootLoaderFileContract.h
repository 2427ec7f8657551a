// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "base/Keys.h"
#include "platform/BootLoaderFile.h"

namespace tavisk {

/// `Machine` offers: service(); put(path, contents) and file(path) of the machine's files.
template <typename Machine>
struct BootLoaderFileContract : testing::Test {
  const Keys contents =
      keys({{"Timeout", 5}, {BootLoaderFile::architectureKey, "i386"}, {"Kernel", PropertyList::Data{0, 255}}});
  const std::string path = BootLoaderFile::path;
  Machine machine;
};

TYPED_TEST_SUITE_P(BootLoaderFileContract);

TYPED_TEST_P(BootLoaderFileContract, readsBackWhatWasWritten) {
  EXPECT_EQ(*this->machine.service().read(), std::nullopt);
  for (int times = 0; times < 2; ++times) {
    EXPECT_TRUE(this->machine.service().write(this->contents));
    EXPECT_EQ(*this->machine.service().read(), this->contents);
  }
}

TYPED_TEST_P(BootLoaderFileContract, keepsBesideWhatItDoesNotUnderstand) {
  for (const char* damaged : {"<dict><key>", "<string>no dictionary</string>", ""}) {
    this->machine.put(this->path, damaged);
    EXPECT_FALSE(this->machine.service().read());
    EXPECT_TRUE(this->machine.service().write(this->contents));
    EXPECT_EQ(*this->machine.service().read(), this->contents);
    EXPECT_EQ(this->machine.file(this->path + ".damaged"), damaged);
  }
}

TYPED_TEST_P(BootLoaderFileContract, saysWhenItWasNotWritten) {
  this->machine.put("/Library/Preferences", "no folder");
  EXPECT_FALSE(this->machine.service().write(this->contents));
  auto unwritable = this->contents;
  unwritable.set("Name", std::string("\x01"));
  EXPECT_FALSE(this->machine.service().write(unwritable));
}

REGISTER_TYPED_TEST_SUITE_P(BootLoaderFileContract, readsBackWhatWasWritten, keepsBesideWhatItDoesNotUnderstand,
                            saysWhenItWasNotWritten);

}  // namespace tavisk

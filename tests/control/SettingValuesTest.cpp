// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <map>
#include <string>

#include "base/Calendar.h"
#include "control/SettingValues.h"
#include "frontend/CommandTable.h"

namespace tavisk::control {
namespace {

using testing::Contains;
using testing::Field;
using testing::IsEmpty;
using testing::Pointee;
using testing::SizeIs;

constexpr const char* wrong = "wrong";

const ManagedSetting& named(const char* name) {
  return *settingMeantBy(name);
}

TEST(SettingValues, EachSettingHasWordsThatGiveItAValue) {
  const std::map<ValueKind, std::string> values = {
      {ValueKind::moment, "60"},        {ValueKind::onOff, "on"},          {ValueKind::minutes, "10"},
      {ValueKind::startupDelay, "120"}, {ValueKind::architecture, "i386"}, {ValueKind::text, "a"},
      {ValueKind::startupDisk, "a"},
  };
  const auto table = CommandTable::parse(CommandTable::text());
  for (const auto& setting : managedSettings()) {
    const auto value = valueMeantBy(setting, values.at(setting.kind));
    ASSERT_TRUE(value) << setting.name;
    const auto words = setterWords(setting, *value);
    ASSERT_THAT(words, Not(IsEmpty())) << setting.name;
    for (const auto& word : words) {
      ASSERT_THAT(word, SizeIs(2)) << setting.name;
      ASSERT_THAT(table->findTyped(word.front()), Pointee(Field(&CommandTable::Entry::arguments, 1))) << setting.name;
      EXPECT_THAT(askedBy(word.front(), word.back()), Contains(Field(&AskedValue::setting, &setting)));
    }
  }
}

struct Written {
  const char* setting;
  WrittenValue value;
  const char* unit;
  std::string meant;  ///< wrong: it is none
  std::string argument;
};

TEST(SettingValues, AreReadAsPeopleAndStatusWriteThem) {
  setDefaultTimeZone("");
  for (const auto& [name, value, unit, meant, argument] : {
           Written{"remotelogin", true, "", "on", "On"},
           Written{"remotelogin", "YES", "", "on", "On"},
           Written{"remotelogin", "oFF", "", "off", "Off"},
           Written{"remotelogin", "True", "", "on", "On"},
           Written{"remotelogin", std::int64_t{1}, "", wrong, ""},
           Written{"remotelogin", "partly", "", wrong, ""},
           Written{"displaysleep", std::int64_t{10}, "", "10", "10"},
           Written{"displaysleep", "1 minute", "minutes", "1", "1"},
           Written{"displaysleep", "Never", "", "0", "Never"},
           Written{"displaysleep", "10 on sda, 0 on sdb", "minutes", wrong, ""},
           Written{"displaysleep", std::int64_t{-1}, "", wrong, ""},
           Written{"displaysleep", false, "", "0", "Never"},
           Written{"displaysleep", true, "", wrong, ""},
           Written{"startupdelay", std::int64_t{90}, "", "3", "90"},
           Written{"startupdelay", "90 seconds", "", "3", "90"},
           Written{"startupdelay", "3", "units of 30 seconds", "3", "90"},
           Written{"startupdelay", "3", "", wrong, ""},
           Written{"startupdelay", std::int64_t{7680}, "", wrong, ""},
           Written{"startupdelay", "256", "units of 30 seconds", wrong, ""},
           Written{"time", std::int64_t{86399}, "", "86399", "23:59:59"},
           Written{"time", "2026-02-28 07:06:05", "", "2026-02-28 07:06:05", "07:06:05"},
           Written{"time", "2026-02-30 07:06:05", "", wrong, ""},
           Written{"time", "2026-02-28 24:00:00", "", wrong, ""},
           Written{"time", "2026-02-28", "", wrong, ""},
           Written{"kernelarchitecture", "DEFAULT", "", "default", "default"},
           Written{"kernelarchitecture", "arm", "", wrong, ""},
           Written{"computername", "a \"b\"\n", "", "a \"b\"\n", "a \"b\"\n"},
           Written{"computername", std::string(1, '\0'), "", wrong, ""},
           Written{"computername", std::int64_t{5}, "", wrong, ""},
       }) {
    const auto read = valueMeantBy(named(name), value, unit);
    ASSERT_EQ(read.valueOr(wrong), meant) << name << " " << value.index();
    if (!read) continue;
    EXPECT_EQ(setterWords(named(name), *read).back().back(), argument);
  }
}

struct Typed {
  const char* word;
  const char* argument;
  std::size_t settings;
  std::optional<std::string> value;
};

/// What a word does not take as it is written here is for the word to judge: it must not pass for what is there.
TEST(SettingValues, OfWordsAreKnownAsFarAsTheyArePlain) {
  for (const auto& [word, argument, settings, value] : {
           Typed{"SetRemoteLogin", "OFF", 1, "off"},
           Typed{"-setremotelogin", "no", 1, std::nullopt},
           Typed{"-setsleep", "5", 3, "5"},
           Typed{"-setsleep", "5x", 3, std::nullopt},
           Typed{"-setsleep", "00", 3, std::nullopt},
           Typed{"setdate", "11:22:26", 1, std::nullopt},
           Typed{"-setwaitforstartupafterpowerfailure", "60", 1, "2"},
           Typed{"-setwaitforstartupafterpowerfailure", "45", 1, std::nullopt},
           Typed{"-setstartupdisk", "Main", 1, std::nullopt},
           Typed{"-setcomputername", "", 1, std::nullopt},
           Typed{"-getremotelogin", "off", 0, std::nullopt},
       }) {
    const auto asked = askedBy(word, argument);
    ASSERT_EQ(asked.size(), settings) << word;
    for (const auto& one : asked) EXPECT_EQ(one.value, value) << word << " " << argument;
  }
}

}  // namespace
}  // namespace tavisk::control

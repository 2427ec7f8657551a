// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <string>

#include "control/apply/ApplyPlan.h"
#include "control/apply/WantedFile.h"

namespace tavisk::control {
namespace {

using testing::HasSubstr;

/// "NAME=VALUE; ..." in the order of the text, or what is wrong with it.
std::string read(std::string_view text) {
  const auto wanted = wantedIn(text, "file");
  if (!wanted) return wanted.failure().why;
  std::string told;
  for (const auto& [setting, value] : *wanted) told.append(setting->name).append("=").append(value).append("; ");
  return told;
}

TEST(WantedFile, IsReadInItsOrderOrRefusedWithTheReason) {
  constexpr std::pair<const char*, const char*> files[] = {
      {R"({"remote-login": "on", "Time Zone": "Europe/Paris"})", "Remote Login=on; Time Zone=Europe/Paris; "},
      {R"({"settings": {"timezone": {"live": "a", "stored": "a"}}})", "Time Zone=a; "},
      {R"({"Kernel Architecture": {"supported": true, "stored": "default"}})", "Kernel Architecture=default; "},
      {R"({"localsubnetname": {"supported": true, "live": "a", "stored": "a.org"}})", "Local Subnet Name=a.org; "},
      {R"({"timezone": {"supported": true, "live": "a", "stored": "b"}})", "timezone: live and stored differ"},
      {R"({"networktimeserver": {"supported": true, "live": "in.use", "stored": "a.org"}})",
       "Network Time Server=a.org; "},
      {R"({"networktimeserver": {"supported": true, "live": "in.use"}})", ""},
      {R"({"Wake On Modem": {}})", "Wake On Modem: \"on\" or \"off\" is expected"},
      {R"({"Keyboard Lock": "off"})", "there is no setting Keyboard Lock"},
      {R"({"timezone": "a", "timezone": "b"})", "timezone stands there twice"},
      {R"({"timezone": "a", "Time Zone": "b"})", "Time Zone stands there twice"},
      {R"({"timezone": null})", "timezone: a text is expected"},
      {R"({"timezone": ["a"]})", "timezone: a text is expected"},
      {R"({"displaysleep": 1.5})", "displaysleep: a number of minutes"},
      {R"({"displaysleep": 18446744073709551615})", "displaysleep: a number of minutes"},
      {R"({"settings": []})", "settings: an object is expected"},
      {R"({"status": 1, "settings": {"timezone": "a"}})", "Time Zone=a; "},
      {R"({"settings": {"timezone": "a"}, "tme zone": "b"})", "tme zone stands beside settings"},
      {R"({"Time Zone": "b", "settings": {}})", "Time Zone stands beside settings"},
      {"[]", "an object of settings"},
      {"{\n\"timezone\" \"a\"}", "at line 2, column 14: "},
      {"{\"timezone\": \"\xff\"}", "invalid string: ill-formed UTF-8"},
      {"", "at line 1, column 1: "},
  };
  for (const auto& [text, told] : files) EXPECT_THAT(read(text), HasSubstr(told)) << text;
  for (const auto* text :
       {"{}", R"({"Time": {"supported": true, "live": "0"}})",
        R"({"Wake On Modem": {"supported": false}, "Keyboard Lock": {"supported": true, "live": "off"}})"})
    EXPECT_EQ(read(text), "");
}

TEST(ApplyPlan, BringsWishesInTheOrderThatTheMachineCanTake) {
  const auto orderOf = [](const char* text) {
    std::string order;
    for (const auto& step : stepsFor(*wantedIn(text, "file")))
      order.append(step.asked.front().setting->name).append("; ");
    return order;
  };
  EXPECT_EQ(orderOf(R"({"remotelogin": "on", "time": 0, "displaysleep": 1, "networktimeserver": "a", "timezone": "a",
                        "networktime": "off"})"),
            "Network Time; Time Zone; Time; Network Time Server; Display Sleep; Remote Login; ");
  EXPECT_EQ(
      orderOf(R"({"startupdisk": "a", "networktime": "on", "computername": "a", "networktimeserver": "a", "time": 0})"),
      "Time; Network Time Server; Network Time; Computer Name; Startup Disk; ");
}

}  // namespace
}  // namespace tavisk::control

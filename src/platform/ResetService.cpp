// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/ResetService.h"

#include <algorithm>
#include <iterator>
#include <string_view>
#include <utility>

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* ofManager = "a service starts by links that its package makes as well, not by a file of tavisk's";
constexpr const char* ofHardware = "the hardware keeps it, and no other value beside it";
constexpr const char* ofMachine = "it is the machine's own value, in no file of tavisk's";

constexpr std::pair<std::string_view, const char*> neverOwn[] = {
    {setting::time, "a clock goes on, and is in no file of tavisk's"},
    {setting::timeZone, ofMachine},
    {setting::networkTime, ofManager},
    {setting::restartAfterPowerFailure, ofHardware},
    {setting::startupDelay, ofHardware},
    {setting::remoteLogin, ofManager},
    {setting::remoteEvents, ofManager},
    {setting::computerName, ofMachine},
    {setting::localSubnetName, ofMachine},
    {setting::startupDisk, ofMachine},
};

}  // namespace

std::optional<Failure> whyNeverOwn(const std::string& setting) {
  const auto* const found = std::ranges::find(neverOwn, setting, &std::pair<std::string_view, const char*>::first);
  if (found == std::end(neverOwn)) return std::nullopt;
  return Failure{"reset", "", found->second};
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <cstdint>
#include <memory>

#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"
#include "settings/LeadingNumber.h"
#include "settings/SpecialPMUSettings.h"

namespace tavisk {
namespace {

constexpr std::int64_t secondsInUnit = 30;
constexpr const char* delays = "a number of seconds from 0 to 7650 that is divisible by 30";

/// A controller may answer any 64-bit number: the product wraps.
std::int64_t secondsOf(std::int64_t units) {
  return static_cast<std::int64_t>(static_cast<std::uint64_t>(units) * secondsInUnit);
}

}  // namespace

void ServerCommands::getWaitForStartupAfterPowerFailure() {
  const auto units = sharedSpecialPMU().getTime();
  _context.output.print("getwaitforstartupafterpowerfailure: %ld seconds\n", secondsOf(units));
}

void ServerCommands::setWaitForStartupAfterPowerFailure(const std::string& seconds) {
  const auto wait = leadingInteger(seconds);
  setError(false);
  if (wait % secondsInUnit != 0) {
    _context.output.putLine("setwaitforstartupafterpowerfailure: Error, value must be divisible by 30.");
    refuse(delays);
    return;
  }
  // What is no number sets the delay to 0 all the same.
  if (!beginsWithNumber(seconds)) refuse(delays);
  if (!sharedSpecialPMU().setTime(wait / secondsInUnit)) return;
  _context.output.print("setwaitforstartupafterpowerfailure: %ld seconds\n", wait);
}

SpecialPMUSettings& ServerCommands::sharedSpecialPMU() {
  if (!_specialPMU) {
    _specialPMU = std::make_shared<SpecialPMUSettings>(_context.host.powerController(), _context.host.systemLog(),
                                                       _context.output);
  }
  return *_specialPMU;
}

HandlerRows startupDelayHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getWaitForStartupAfterPowerFailure", &ServerCommands::getWaitForStartupAfterPowerFailure},
      {"setWaitForStartupAfterPowerFailure:", &ServerCommands::setWaitForStartupAfterPowerFailure},
  };
  return rows;
}

}  // namespace tavisk

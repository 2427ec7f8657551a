// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/NetworkTimeFacts.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>
#include <iterator>

#include "hosts/linux/clock/SystemClock.h"

namespace tavisk {
namespace {

std::string notKnown(const Failure& why) {
  return "not known: " + describe(why);
}

/// The kernel's own account, which every client keeps.
Facts clockFacts() {
  const auto discipline = clockDiscipline();
  if (!discipline) return {{"synchronized", notKnown(discipline.failure())}};
  if (!*discipline) return {{"synchronized", "no"}};
  const auto milliseconds = std::chrono::ceil<std::chrono::milliseconds>((*discipline)->largestError);
  return {{"synchronized", "yes"}, {"milliseconds off at most", std::to_string(milliseconds.count())}};
}

std::string inMilliseconds(std::chrono::microseconds span) {
  std::array<char, 64> text{};
  const std::chrono::duration<double, std::milli> milliseconds = span;
  static_cast<void>(std::snprintf(text.data(), text.size(), "%.3f", milliseconds.count()));
  return text.data();
}

Facts sourceFacts(const Result<TimeSource>& source) {
  if (!source) return {{"source", notKnown(source.failure())}};
  if (source->server.empty()) return {};
  Facts facts{{"source", source->server}};
  constexpr const char* aheadOf = "milliseconds ahead of the source";
  const auto& ahead = source->ahead;
  if (!ahead) facts.emplace_back(aheadOf, notKnown(ahead.failure()));
  if (ahead && *ahead) facts.emplace_back(aheadOf, inMilliseconds(**ahead));
  return facts;
}

}  // namespace

Facts networkTimeFacts(const TimeDaemon* running, const LinuxMachine& machine) {
  Facts facts;
  if (machine.root.prefix() == "/") facts = clockFacts();
  if (running) std::ranges::move(sourceFacts(sourceInUse(*running, machine)), std::back_inserter(facts));
  return facts;
}

}  // namespace tavisk

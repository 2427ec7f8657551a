// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/SystemClock.h"

#include <fcntl.h>
#include <linux/capability.h>
#include <linux/rtc.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <sys/timex.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <ctime>

#include "base/Calendar.h"
#include "base/Text.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

// 30 years before the kernel's last second, which is 2^63 - 1 nanoseconds (include/linux/time64.h).
constexpr std::int64_t lastSettableSecond = 9223372036 - std::int64_t{30} * 365 * 24 * 3600 - 1;
constexpr const char* clockName = "CLOCK_REALTIME";

std::int64_t seconds(clockid_t clock) {
  timespec time{};
  ::clock_gettime(clock, &time);
  return time.tv_sec;
}

std::chrono::microseconds systemMicroseconds() {
  return std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::system_clock::now().time_since_epoch());
}

/// The third line of /etc/adjtime is UTC or LOCAL; UTC without the file.
Result<bool> keepsLocalTime(const SystemRoot& root) {
  constexpr std::size_t limit = 4096;
  const auto text = orEmpty(root.read("/etc/adjtime", limit));
  if (!text) return text.failure();
  const auto lines = split(*text, "\n");
  return lines.size() > 2 && lines[2] == "LOCAL";
}

DateTime utcDateTime(std::int64_t secondsSince1970) {
  std::time_t time = secondsSince1970;
  std::tm parts{};
  ::gmtime_r(&time, &parts);
  return {parts.tm_year + 1900, parts.tm_mon + 1, parts.tm_mday, parts.tm_hour, parts.tm_min, parts.tm_sec};
}

rtc_time rtcTime(const DateTime& time) {
  rtc_time parts{};
  parts.tm_year = static_cast<int>(time.year) - 1900;
  parts.tm_mon = static_cast<int>(time.month) - 1;
  parts.tm_mday = static_cast<int>(time.day);
  parts.tm_hour = static_cast<int>(time.hour);
  parts.tm_min = static_cast<int>(time.minute);
  parts.tm_sec = static_cast<int>(time.second);
  return parts;
}

}  // namespace

std::int64_t systemTime() {
  return seconds(CLOCK_REALTIME);
}

std::optional<Failure> whyOutOfClockRange(std::int64_t secondsSince1970) {
  const auto refusal = [](const char* why) { return Failure{"set the clock", clockName, why}; };
  if (secondsSince1970 < 0) return refusal("Linux has no time before 1970");
  if (secondsSince1970 > lastSettableSecond) return refusal("Linux sets no time after April 2232");
  if (secondsSince1970 < seconds(CLOCK_MONOTONIC))
    return refusal("Linux sets no time so near to 1970 that the machine would have started before");
  return std::nullopt;
}

bool maySetSystemTime() {
  __user_cap_header_struct header{_LINUX_CAPABILITY_VERSION_3, 0};
  std::array<__user_cap_data_struct, _LINUX_CAPABILITY_U32S_3> sets{};
  if (::syscall(SYS_capget, &header, sets.data()) != 0) return false;
  return (sets[CAP_TO_INDEX(CAP_SYS_TIME)].effective & CAP_TO_MASK(CAP_SYS_TIME)) != 0;
}

bool mayNobodySetSystemTime(const SystemRoot& root) {
  constexpr std::string_view title = "CapBnd:";
  constexpr std::size_t limit = 65536;
  const auto status = root.read("/proc/1/status", limit).valueOr("");
  for (const auto& line : split(status, "\n")) {
    if (!line.starts_with(title)) continue;
    const auto rights = parseNumber<std::uint64_t>(trimmed(std::string_view(line).substr(title.size())), 16);
    return rights && ((*rights >> unsigned{CAP_SYS_TIME}) & 1U) == 0;
  }
  return false;
}

Result<void> setSystemTime(std::chrono::microseconds since1970) {
  const auto whole = std::chrono::floor<std::chrono::seconds>(since1970);
  timespec time{};
  time.tv_sec = whole.count();
  time.tv_nsec = std::chrono::nanoseconds(since1970 - whole).count();
  if (::clock_settime(CLOCK_REALTIME, &time) != 0) return systemFailure("clock_settime", clockName, errno);
  return {};
}

Result<std::optional<ClockDiscipline>> clockDiscipline() {
  timex kernels{};
  if (::adjtimex(&kernels) < 0) return systemFailure("adjtimex", clockName, errno);
  if ((static_cast<unsigned>(kernels.status) & static_cast<unsigned>(STA_UNSYNC)) != 0) return std::nullopt;
  return std::optional(ClockDiscipline{std::chrono::microseconds(kernels.maxerror)});
}

Result<std::optional<std::int64_t>> hardwareTime(const SystemRoot& root) {
  constexpr std::size_t limit = 64;
  const auto text = orGone(root.read("/sys/class/rtc/rtc0/since_epoch", limit));
  if (!text) return text.failure();
  if (!*text) return std::optional<std::int64_t>();
  const auto seconds = leadingInteger(**text);
  const auto isLocal = keepsLocalTime(root);
  if (!isLocal) return isLocal.failure();
  // The kernel takes what the clock shows for UTC.
  return std::optional(*isLocal ? static_cast<std::int64_t>(secondsSince1970(utcDateTime(seconds))) : seconds);
}

std::chrono::microseconds AskedTime::sinceThen() const {
  return std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - _moment);
}

std::chrono::microseconds AskedTime::now() const {
  return std::chrono::seconds(_seconds) + sinceThen();
}

std::int64_t AskedTime::microsecondsAhead() const {
  return (now() - systemMicroseconds()).count();
}

std::int64_t AskedTime::onSystemClock() {
  return told(systemMicroseconds(), std::chrono::seconds(1), _system);
}

Result<std::optional<std::int64_t>> AskedTime::onHardwareClock(const SystemRoot& root) {
  auto shown = hardwareTime(root);
  if (!shown || !*shown) return shown;
  return std::optional(told(std::chrono::seconds(**shown), std::chrono::seconds(2), _hardware));  // without fractions
}

std::int64_t AskedTime::told(std::chrono::microseconds shown, std::chrono::seconds near,
                             std::optional<Look>& first) const {
  const auto then = shown - sinceThen();
  if (!first) first = then;
  if (_isSet && std::chrono::abs(then - std::chrono::seconds(_seconds)) <= near) return _seconds;
  const bool hasGoneOn = _isSet && std::chrono::abs(then - *first) <= near;
  return std::chrono::floor<std::chrono::seconds>(hasGoneOn ? *first : then).count();
}

Result<std::optional<HardwareClock>> HardwareClock::open(const SystemRoot& root) {
  auto device = orGone(root.open(hardwareClock, O_RDONLY | O_NONBLOCK));
  if (!device) return device.failure();
  if (!*device) return std::optional<HardwareClock>();
  const auto isLocal = keepsLocalTime(root);
  if (!isLocal) return isLocal.failure();
  return std::optional(HardwareClock(*std::move(device).value(), *isLocal));
}

Result<void> HardwareClock::set(std::int64_t secondsSince1970) const {
  auto time = rtcTime(_isLocal ? localDateTime(secondsSince1970) : utcDateTime(secondsSince1970));
  if (::ioctl(_device.number(), RTC_SET_TIME, &time) != 0) return systemFailure("RTC_SET_TIME", hardwareClock, errno);
  return {};
}

}  // namespace tavisk

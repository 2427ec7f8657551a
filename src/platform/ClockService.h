// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

/// The name of a time zone as the time-zone database has it ("Europe/Paris"), or a text that was taken for one.
struct ZoneName {
  std::string text;

  /// Where a machine keeps its compiled zones (tzfile(5)), each under its name.
  static constexpr std::string_view folder = "/usr/share/zoneinfo/";
  /// Other trees of the same zones in that folder.
  static constexpr std::string_view variants[] = {"posix/", "right/"};

  std::string file() const { return std::string(folder) + text; }
  /// Whether it is made as the names of zones are: of ASCII letters, digits and "+-_" with single slashes between them.
  bool isWellFormed() const;
  /// Whether a list of one name a line can have it: not empty, and without a line end.
  bool fitsOneLine() const { return !text.empty() && text.find_first_of("\r\n") == std::string::npos; }
  /// Whether its file is in the folder, whatever the name is made of.
  bool staysInFolder() const;

  bool operator==(const ZoneName&) const = default;
};

/// The zone of a machine that has none.
inline ZoneName utc() {
  return {"UTC"};
}

/// The zone that a link to a zone's file, or the path of one, means: what follows "zoneinfo/", without the variants.
/// Absent when the path names no well-formed zone.
std::optional<ZoneName> zoneOfPath(std::string_view path);

/// How effects and reports tell zones: by their names, one a line.
inline std::string textOf(const ZoneName& zone) {
  return zone.text;
}
std::string textOf(const std::vector<ZoneName>& zones);

/// The system clock and its time zone. Results of the setters go to the effects, not to the caller.
class ClockService {
 public:
  virtual ~ClockService() = default;

  /// Seconds since 1970-01-01 00:00:00 UTC.
  virtual std::int64_t now() = 0;
  virtual void setTime(std::int64_t secondsSince1970) = 0;

  /// Each fits one line; in no particular order; empty when the host has none.
  virtual std::vector<ZoneName> knownTimeZones() = 0;
  /// "UTC" when the machine has no zone.
  virtual ZoneName timeZone() = 0;
  virtual void setTimeZone(const ZoneName& zone) = 0;
  /// The compiled zone file (absolute path on the machine that runs the tool) with the rules of a zone.
  virtual std::string rulesOf(const ZoneName& zone) = 0;
};

}  // namespace tavisk

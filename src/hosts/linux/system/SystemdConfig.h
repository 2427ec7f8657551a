// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The configuration of one of the service manager's daemons, as it reads it (systemd-timesyncd's timesyncd.conf(5)
/// describes the order): the main file, then the drop-ins of all folders by name, where /etc hides /run and /run hides
/// /usr.
class SystemdConfig {
 public:
  /// `file` is the name of the main file: "timesyncd.conf". The root must outlive the object.
  SystemdConfig(const SystemRoot& root, std::string file) : _root(root), _file(std::move(file)) {}

  /// The words of a key that collects values, such as "NTP": an empty assignment forgets the ones before it.
  Result<std::vector<std::string>> words(std::string_view section, std::string_view key) const;
  /// What words() would be without the tool's own drop-in.
  Result<std::vector<std::string>> wordsBesideOwn(std::string_view section, std::string_view key) const;
  /// A value and the file that it comes from.
  struct Assignment {
    std::string file;
    std::string value;
  };
  /// The last assignment of a key that has one value; absent when there is none, or when it is empty.
  Result<std::optional<Assignment>> last(std::string_view section, std::string_view key) const;
  /// The same in the own drop-in alone.
  Result<std::optional<std::string>> own(std::string_view section, std::string_view key) const;
  /// The tool's own drop-in.
  std::string ownDropIn() const;
  /// The file that has the last word on a key instead of the own drop-in, unless its value is as asked; else empty.
  Result<std::string> whatHides(std::string_view section, std::string_view key,
                                const std::function<bool(const std::string& value)>& isAsAsked) const;
  /// Writes these keys into the own drop-in, which has this one section; its other keys stay. One that cannot
  /// be read is left as it is. Reads and writes: not to be called by two at once (MachineLock).
  Result<void> setOwn(const std::string& section, const std::map<std::string, std::string>& values) const;
  /// Whether the own drop-in assigns one of the keys.
  Result<bool> hasOwn(const std::string& section, const std::vector<std::string>& keys) const;
  /// Takes these keys out of the own drop-in, and the file away when it has no other.
  Result<void> removeOwn(const std::string& section, const std::vector<std::string>& keys) const;

 private:
  /// The keys of the own drop-in in one section, with their last values.
  Result<std::map<std::string, std::string>> ownValues(const std::string& section) const;
  Result<void> writeOwn(const std::string& section, const std::map<std::string, std::string>& values) const;
  Result<std::vector<std::string>> files() const;
  static std::vector<std::string> wordsOf(const std::vector<Assignment>& assigned);
  /// The values of a key in each of the files, in order.
  Result<std::vector<Assignment>> all(std::string_view section, std::string_view key) const;

  const SystemRoot& _root;
  std::string _file;
};

/// The files of these folders (each with "/" at its end) that have this ending, sorted by name; where two have the same
/// name, that of the earlier folder. A folder may be missing. A link to /dev/null is no file and hides the others of
/// its name.
Result<std::vector<std::string>> configurationFiles(const SystemRoot& root, const std::vector<std::string>& folders,
                                                    std::string_view ending = ".conf");

/// The values of a key in one file of such a kind, in order; later lines come later.
std::vector<std::string> assignments(std::string_view text, std::string_view section, std::string_view key);

}  // namespace tavisk

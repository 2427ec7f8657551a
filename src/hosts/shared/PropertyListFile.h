// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/PropertyList.h"
#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// A file of the machine that holds a property-list dictionary.
class PropertyListFile {
 public:
  /// The root is not owned.
  PropertyListFile(const SystemRoot& root, std::string path) : _root(root), _path(std::move(path)) {}

  const std::string& path() const { return _path; }
  /// Absent when there is no file; a failure when it cannot be read or is something else.
  Result<std::optional<PropertyList::Dictionary>> read() const;
  /// What a change of the file begins with, to be read while nobody else changes it: empty when there is no file or
  /// write() would keep it beside as damaged. A file that cannot be read is a failure, and must not be written.
  Result<PropertyList::Dictionary> readToChange() const;
  /// Replaces the file whole, or makes it and its folders. What read() cannot understand is kept beside it first, as
  /// NAME.damaged. The files that are written are added to `written`.
  Result<void> write(const PropertyList::Dictionary& contents, WrittenPlaces& written) const;
  /// Takes the key out of the file, and the file away when it has no other. One that read() cannot understand is left.
  Result<void> removeKey(const std::string& key, WrittenPlaces& written) const;

 private:
  /// Absent when there is no file.
  Result<std::optional<std::string>> text() const;
  Result<void> keepDamaged(WrittenPlaces& written) const;
  Result<void> put(const std::string& path, const std::string& text, WrittenPlaces& written) const;

  const SystemRoot& _root;
  std::string _path;
};

}  // namespace tavisk

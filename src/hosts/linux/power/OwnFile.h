// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// One of the files that the tool writes for itself alone (OwnFiles.h).
class OwnFile {
 public:
  /// The root must outlive the object.
  OwnFile(const SystemRoot& root, std::string path) : _root(root), _path(std::move(path)) {}

  const std::string& path() const { return _path; }
  /// Empty when there is no such file.
  Result<std::string> text() const;
  /// Puts these lines in place of the old ones. A file that cannot be read stays as it is.
  Result<void> replace(const std::string& lines) const;

  /// Absent when there is no such file.
  Result<std::optional<std::string>> contents() const;
  /// Makes the file what contents() said.
  Result<void> putBack(const std::optional<std::string>& contents) const;

  /// The whole file as what the tool itself stores of a setting, for which it must outlive that.
  OwnPart asPart() const;

  /// Why it would not be changed: by whoever runs this, or as another file, `hiding`, has the last word; empty: none
  /// has.
  Result<void> check(const std::string& hiding = "") const;

  /// A change of the file, where other files have a say in the same matter.
  struct Change {
    std::function<Result<void>()> write;
    std::function<Result<bool>()> isHeeded;   ///< asked of all files afterwards
    std::function<std::string()> hidingFile;  ///< empty: it is not known
  };
  /// A change that another file hides all the same is a failure, and the file is put back as it was.
  Result<void> changeIfHeeded(const Change& change) const;
  /// Does this to the file, and adds it to the places when that was done, or has left other contents all the same.
  Result<void> noting(WrittenPlaces& written, const std::function<Result<void>()>& step) const;
  /// Does this to the file, and adds it to the places when that has left other contents.
  Result<void> notingChange(WrittenPlaces& written, const std::function<Result<void>()>& step) const;

 private:
  const SystemRoot& _root;
  std::string _path;
};

/// Has `store` keep the setting in the file, which must outlive it.
template <typename Value>
void keepIn(const OwnFile& file, Setting<Value>& setting, const typename Setting<Value>::Write& store) {
  const auto written = std::make_shared<WrittenPlaces>();
  setting.where = file.path();
  setting.written = [written] { return written->text(); };
  setting.store = [&file, written, store](const Value& asked) {
    return file.noting(*written, [&] { return store(asked); });
  };
}

/// What is found while the tool's own file has another value, which waits for other files to go: this is told.
template <typename Value>
Reading<Value> whileWaits(const Reading<Value>& found, const Value& own, const std::string& ownFile) {
  return {found.value, change::textOfReading(found) + ", while " + textOf(own) + " waits in " + ownFile};
}

/// What all files come to, a value or a reading of it, may be none, and whether the tool's own file has another one.
template <typename Found, typename Value>
Result<std::optional<Reading<Value>>> besideOwn(const Result<Found>& all, const Result<std::optional<Value>>& own,
                                                const std::string& ownFile) {
  if (!all) return all.failure();
  if (!own) return own.failure();
  const auto found = std::optional<Reading<Value>>(*all);
  if (!found || !*own || **own == found->value) return found;
  return whileWaits(*found, **own, ownFile);
}

}  // namespace tavisk

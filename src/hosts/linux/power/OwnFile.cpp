// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/OwnFile.h"

#include "hosts/linux/power/PowerLimits.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {

Result<std::string> OwnFile::text() const {
  return orEmpty(_root.read(_path, powerFileLimit));
}

Result<void> OwnFile::replace(const std::string& lines) const {
  if (auto failure = whyNeedsRoot("write", _path)) return *failure;
  if (const auto old = text(); !old) return old.failure();
  return _root.write(_path, ownfile::header + lines);
}

Result<std::optional<std::string>> OwnFile::contents() const {
  return orAbsent(_root.read(_path, powerFileLimit));
}

Result<void> OwnFile::putBack(const std::optional<std::string>& contents) const {
  return contents ? _root.write(_path, *contents) : _root.remove(_path);
}

OwnPart OwnFile::asPart() const {
  const auto isThere = [this]() -> Result<bool> {
    const auto present = contents();
    if (!present) return present.failure();
    return present->has_value();
  };
  const auto takeAway = [this](WrittenPlaces& taken) {
    return notingChange(taken, [this] { return _root.remove(_path); });
  };
  return {.isThere = isThere, .check = [this] { return check(); }, .takeAway = takeAway};
}

Result<void> OwnFile::check(const std::string& hiding) const {
  if (auto failure = whyNeedsRoot("write", _path)) return *failure;
  if (!hiding.empty()) return Failure{"write", _path, hiding + " says otherwise"};
  return {};
}

Result<void> OwnFile::changeIfHeeded(const Change& change) const {
  if (auto failure = whyNeedsRoot("write", _path)) return *failure;
  const auto former = contents();
  if (!former) return former.failure();
  if (auto written = change.write(); !written) return written;
  const auto heeded = change.isHeeded();
  if (heeded && *heeded) return {};
  const auto hiding = change.hidingFile();
  if (const auto back = putBack(*former); !back) return retold(back.failure(), "put back", _path);
  if (!heeded) return heeded.failure();
  return Failure{"write", _path, (hiding.empty() ? "another file" : hiding) + " says otherwise: put back as it was"};
}

Result<void> OwnFile::noting(WrittenPlaces& written, const std::function<Result<void>()>& step) const {
  WrittenPlaces changed;
  auto done = notingChange(changed, step);
  if (done || !changed.text().empty()) written.add(_path);
  return done;
}

Result<void> OwnFile::notingChange(WrittenPlaces& written, const std::function<Result<void>()>& step) const {
  const auto former = contents();
  auto done = step();
  const auto now = contents();
  if (former && (!now || *now != *former)) written.add(_path);
  return done;
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include "base/FileDescriptor.h"
#include "base/Result.h"

namespace tavisk {

/// Replaces files and links in one folder, each in one step and on the disk when it returns. New contents grow under a
/// temporary name, ".tavisk-" and digits, which its maker keeps locked (flock(2)): a name that nobody holds was left by
/// a killed run, and the next write removes it.
class FolderWriter {
 public:
  /// `folder` is open for reading and outlives the writer; `path` is what failures name.
  FolderWriter(const FileDescriptor& folder, std::string path) : _folder(folder), _path(std::move(path)) {}

  Result<void> writeFile(const std::string& name, std::string_view contents, unsigned modeWhenNew);
  Result<void> writeLink(const std::string& name, const std::string& target);
  Result<void> remove(const std::string& name);

 private:
  struct Temporary;

  void removeLeftovers();
  void removeIfLeft(const std::string& name);
  Result<Temporary> makeTemporary();
  Result<void> fill(const Temporary& temporary, const std::string& name, std::string_view contents,
                    unsigned modeWhenNew);
  Result<void> takeOver(const FileDescriptor& fresh, const std::string& name, unsigned modeWhenNew);
  Result<void> keepLabel(const FileDescriptor& fresh, const std::string& name);
  Result<void> putInPlace(const Temporary& temporary, const std::string& name, std::string_view contents);
  Result<void> rewrite(const std::string& name, std::string_view contents);
  Result<void> overwrite(const FileDescriptor& file, std::string_view contents);
  Result<void> syncFolder();
  Failure failure(const char* tried) const;

  const FileDescriptor& _folder;
  std::string _path;
};

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <set>
#include <string>

#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/FileSystem.h"

namespace tavisk {

/// The files of a machine. Those that are looked at and are there are put into a copy of it as well, with the links
/// that lead to them, so that whoever looks there finds the same; what is only asked for is an empty file there, until
/// it shows to be a folder. What cannot be put there is told to the effects once. From any thread.
class CopiedFiles final : public FileSystem {
 public:
  /// `copy` is the root of the copy. Neither the files nor the effects are owned.
  CopiedFiles(FileSystem& files, SystemRoot copy, EffectSink& effects)
      : _files(files), _copy(std::move(copy)), _effects(effects) {}

  bool exists(const std::string& path) override;
  Result<std::string> read(const std::string& path, std::size_t limit) override;
  Result<std::string> readBeginning(const std::string& path, std::size_t length) override;
  /// What is there is taken for a folder.
  Result<std::string> standardized(const std::string& path) override;

 private:
  Result<std::string> copyWayTo(const std::string& path);
  Result<void> copyLink(const std::string& path, const std::string& target);
  Result<void> makeFolder(const std::string& path);
  void copyFile(const std::string& path, const std::string& contents);
  Result<void> write(const std::string& path, const std::string& contents);
  void tell(const Result<void>& copied);

  FileSystem& _files;
  SystemRoot _copy;
  EffectSink& _effects;
  std::mutex _mutex;                ///< guards the copy
  std::set<std::string> _unopened;  ///< the empty files
  bool _isTold = false;
};

}  // namespace tavisk

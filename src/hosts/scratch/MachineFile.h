// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "base/PropertyList.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/scratch/MachineSection.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// DIR/machine.plist: a property list that describes a machine. Only what was checked against the key table is ever
/// handed out. Any thread may read and change it.
class MachineFile {
 public:
  using Dictionary = PropertyList::Dictionary;
  using Contents = std::shared_ptr<const Dictionary>;
  using Edit = std::function<void(Dictionary& machine)>;
  using Observer = std::function<void(const Contents& before, const Contents& now)>;

  /// The folder must exist; a missing machine.plist is an empty dictionary. The failure says what is wrong
  /// where.
  static Result<std::unique_ptr<MachineFile>> open(const std::string& directory, EffectSink& effects);

  /// The folder itself, whose root is DIR: for the logs beside the file.
  const SystemRoot& folder() const { return _folder; }
  const std::string& path() const { return _path; }

  /// As the file is now. While it cannot be read the last good contents stand, and one effect says so.
  Contents contents();
  /// A dictionary at the top of the file.
  MachineSection section(std::string_view name);

  /// Locks, reads again, edits, and replaces the file (SystemRoot::write). What another run changed meanwhile is kept.
  /// A lock that another run holds is waited for 5 s, and 50 ms on any thread but the one that opened the file.
  Result<void> change(const Edit& edit);

  /// Tells, from the run loop, when the contents are others than those last told; `told` are the first.
  [[nodiscard]] RunLoop::Registration observeChanges(RunLoop& runLoop, Contents told, Observer observer);

 private:
  /// The file at one time.
  struct Version {
    std::optional<std::string> text;  ///< absent: there was no file
    Dictionary machine;
  };
  using VersionRef = std::shared_ptr<const Version>;

  MachineFile(const std::string& directory, EffectSink& effects);
  /// Always reads the file, and takes it to pieces only when its text is not the one last seen.
  Result<VersionRef> read() const;
  Result<std::optional<std::string>> readText() const;
  Result<Dictionary> parse(const std::string& text) const;
  VersionRef lastSeen() const;
  /// What this run has written need not be taken to pieces, as long as the file still has that text.
  void keepWritten(std::string text, Dictionary machine);
  /// Takes over what was read; a failure that is to be told comes back.
  std::optional<Failure> keep(const std::optional<FileStamp>& stamp, const Result<VersionRef>& version);
  Result<FileDescriptor> lock() const;
  Failure inFolder(const Failure& failure) const;
  void recordFailure(const Failure& failure, const char* note);

  std::string _directory;
  std::string _path;
  SystemRoot _folder;
  EffectSink& _effects;
  std::thread::id _owner = std::this_thread::get_id();
  mutable std::mutex _mutex;  ///< of what follows; never held while the file is read
  VersionRef _version = std::make_shared<const Version>();
  std::optional<FileStamp> _stamp = FileStamp{};  ///< of the file as last read; no file has this one
  std::optional<Failure> _failure;                ///< told, and not over
};

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include "base/PropertyList.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// One dictionary of the machine, read by the types and defaults of the key table. Asking for a key that the table does
/// not have at this place, or has with another type, is a mistake of the program: std::logic_error.
class MachineSection {
 public:
  using Values = std::shared_ptr<const PropertyList::Dictionary>;

  /// `place` as in KeyRow; `values` is null where the machine has no such dictionary.
  MachineSection(std::string place, Values values) : _place(std::move(place)), _values(std::move(values)) {}

  bool boolean(std::string_view key) const;
  std::int64_t integer(std::string_view key) const;
  std::string text(std::string_view key) const;
  /// Absent when neither the machine nor the table has one.
  std::optional<std::string> optionalText(std::string_view key) const;
  /// The dictionary under a key, with nothing in it when the machine has none.
  MachineSection section(std::string_view key) const;

  /// In the order of the file.
  std::vector<std::string> keys() const;
  bool isAbsent() const { return !_values; }
  /// The value itself; null when the machine has none.
  const PropertyList* find(std::string_view key) const { return _values ? _values->find(key) : nullptr; }

 private:
  std::string_view defaultOf(std::string_view key) const;

  std::string _place;
  Values _values;
};

/// DIR/machine.plist: a property list that describes a machine. Only what was checked against the key table is ever
/// handed out. Any thread may read and change it.
class MachineFile {
 public:
  using Dictionary = PropertyList::Dictionary;
  using Contents = std::shared_ptr<const Dictionary>;
  using Edit = std::function<void(Dictionary& machine)>;
  using Observer = std::function<void(const Contents& before, const Contents& now)>;

  /// The folder must exist; a missing machine.plist is an empty dictionary. The failure says what is wrong where.
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
  /// What change() locks, for a change of the machine's other files: until the descriptor is closed.
  Result<FileDescriptor> lock() const;

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
  Failure inFolder(const Failure& failure) const;
  void recordFailure(const Failure& failure, const std::string& note);

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

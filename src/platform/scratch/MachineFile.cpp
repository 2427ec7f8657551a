// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/MachineFile.h"

#include <fcntl.h>

#include <chrono>
#include <cstdlib>

#include "platform/FileLock.h"
#include "platform/scratch/FolderWatch.h"
#include "platform/scratch/MachineCheck.h"

namespace tavisk {
namespace {

using namespace std::chrono_literals;

constexpr const char* fileName = "/machine.plist";
constexpr const char* lockName = "/machine.lock";
constexpr const char* rehearsal = "rehearse";
constexpr const char* settingName = "Machine";

/// The times of files go in steps of some milliseconds: what was written within the last step may be written again and
/// look the same.
bool tellsVersions(const std::optional<FileStamp>& stamp) {
  constexpr std::int64_t step = 20'000'000;  // nanoseconds; 10 ms at the slowest kernel clock
  auto now = std::chrono::nanoseconds(std::chrono::system_clock::now().time_since_epoch()).count();
  return !stamp || std::abs(now - stamp->changed) > step;
}

}  // namespace

Result<std::unique_ptr<MachineFile>> MachineFile::open(const std::string& directory, EffectSink& effects) {
  std::unique_ptr<MachineFile> file(new MachineFile(directory, effects));
  if (auto folder = file->_folder.open("/", O_RDONLY | O_DIRECTORY); !folder)
    return Failure{rehearsal, directory, folder.failure().why};
  auto machine = file->read();
  if (!machine) return Failure{rehearsal, machine.failure().on, machine.failure().why};
  file->_contents = std::make_shared<const Dictionary>(std::move(machine).value());
  return file;
}

MachineFile::MachineFile(const std::string& directory, EffectSink& effects)
    : _directory(directory.substr(0, directory.find_last_not_of('/') + 1)),
      _path(_directory + fileName),
      _folder(directory),
      _effects(effects) {}

MachineFile::Contents MachineFile::contents() {
  auto stamp = _folder.stamp(fileName);
  {
    std::lock_guard held(_mutex);
    if (stamp == _stamp) return _contents;
  }
  // What counts is when reading begins.
  auto telling = tellsVersions(stamp) ? stamp : FileStamp{};
  auto machine = read();
  if (auto failure = keep(telling, machine)) recordFailure(*failure, "the contents last read stand");
  std::lock_guard held(_mutex);
  return _contents;
}

std::optional<Failure> MachineFile::keep(const std::optional<FileStamp>& stamp, Result<Dictionary>& machine) {
  std::lock_guard held(_mutex);
  _stamp = stamp;
  if (machine) {
    _contents = std::make_shared<const Dictionary>(std::move(machine).value());
    _failure.reset();
    return std::nullopt;
  }
  bool known = _failure == machine.failure();
  _failure = machine.failure();
  return known ? std::nullopt : _failure;
}

MachineSection MachineFile::section(std::string_view name) {
  auto machine = contents();
  const auto* value = machine->find(name);
  return MachineSection(std::string(name), MachineSection::Values(machine, value ? value->asDictionary() : nullptr));
}

Result<void> MachineFile::change(const Edit& edit) {
  auto held = lock();
  if (!held) return held.failure();
  auto machine = read();
  if (!machine) return machine.failure();
  auto edited = std::move(machine).value();
  edit(edited);
  auto text = writePropertyList(std::move(edited));
  if (!text) return Failure{"write", _path, text.failure().why};
  auto written = _folder.write(fileName, *text);
  if (!written) return inFolder(written.failure());
  return {};
}

RunLoop::Registration MachineFile::observeChanges(RunLoop& runLoop, Contents told, Observer observer) {
  auto compare = std::make_shared<std::function<void()>>([this, told, observer = std::move(observer)]() mutable {
    auto now = contents();
    if (now == told || *now == *told) return;
    auto before = std::exchange(told, now);
    observer(before, now);
  });
  auto watch = watchFolder(_directory, runLoop, [compare] { (*compare)(); });
  if (!watch) {
    recordFailure(watch.failure(), "changes that others make are not noticed");
    return {};
  }
  // What was written before the watch began makes no event.
  runLoop.post([first = std::weak_ptr(compare)] {
    if (auto watched = first.lock()) (*watched)();
  });
  return std::move(watch).value();
}

Result<MachineFile::Dictionary> MachineFile::read() const {
  bool missing = !_folder.exists(fileName) && !_folder.readLink(fileName);
  if (missing) return Dictionary();
  auto text = _folder.read(fileName, ownFileLimits.bytes);
  if (!text) return inFolder(text.failure());
  auto list = parsePropertyList(*text, ownFileLimits);
  if (!list) return Failure{"read", _path, list.failure().why};
  auto value = std::move(list).value();
  auto* machine = value.asDictionary();
  if (!machine) return Failure{"read", _path, "expected a dictionary"};
  if (auto wrong = whyWrong(*machine)) return Failure{"read", _path, *wrong};
  return std::move(*machine);
}

Result<FileDescriptor> MachineFile::lock() const {
  const auto patience = std::this_thread::get_id() == _owner ? 5000ms : 50ms;
  auto file = lockFile(_folder, lockName, patience);
  if (!file) return inFolder(file.failure());
  return file;
}

void MachineFile::recordFailure(const Failure& failure, const char* note) {
  Effect effect;
  effect.setting = settingName;
  effect.outcome = Outcome::failed;
  effect.note = note;
  effect.failure = failure;
  _effects.record(effect);
}

Failure MachineFile::inFolder(const Failure& failure) const {
  return Failure{failure.tried, _directory + failure.on, failure.why};
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/MachineFile.h"

#include <fcntl.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <memory>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "hosts/scratch/KeyTable.h"
#include "hosts/shared/FileLock.h"

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

/// Runs the work from the run loop whenever a file in the folder was written, moved in or out, or removed (inotify(7)).

void drain(const FileDescriptor& events) {
  std::array<char, 4096> unused{};
  while (::read(events.number(), unused.data(), unused.size()) > 0) continue;
}

Result<RunLoop::Registration> watchFolder(const std::string& folder, RunLoop& runLoop, std::function<void()> work) {
  auto events = std::make_shared<FileDescriptor>(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  constexpr auto mask = IN_CLOSE_WRITE | IN_MOVED_TO | IN_MOVED_FROM | IN_DELETE | IN_ONLYDIR;
  if (!*events || ::inotify_add_watch(events->number(), folder.c_str(), mask) < 0)
    return systemFailure("watch", folder, errno);
  return runLoop.watch(events->number(), RunLoop::Readiness::readable, [events, work = std::move(work)] {
    drain(*events);
    work();
  });
}

}  // namespace

Result<std::unique_ptr<MachineFile>> MachineFile::open(const std::string& directory, EffectSink& effects) {
  std::unique_ptr<MachineFile> file(new MachineFile(directory, effects));
  if (auto folder = file->_folder.open("/", O_RDONLY | O_DIRECTORY); !folder)
    return Failure{rehearsal, directory, folder.failure().why};
  auto version = file->read();
  if (!version) return Failure{rehearsal, version.failure().on, version.failure().why};
  file->_version = *version;
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
    std::scoped_lock held(_mutex);
    if (stamp == _stamp) return Contents(_version, &_version->machine);
  }
  // What counts is when reading begins.
  auto telling = tellsVersions(stamp) ? stamp : FileStamp{};
  if (auto failure = keep(telling, read())) recordFailure(*failure, "the contents last read stand");
  auto version = lastSeen();
  return Contents(version, &version->machine);
}

std::optional<Failure> MachineFile::keep(const std::optional<FileStamp>& stamp, const Result<VersionRef>& version) {
  std::scoped_lock held(_mutex);
  _stamp = stamp;
  if (version) {
    _version = *version;
    _failure.reset();
    return std::nullopt;
  }
  bool known = _failure == version.failure();
  _failure = version.failure();
  return known ? std::nullopt : _failure;
}

MachineFile::VersionRef MachineFile::lastSeen() const {
  std::scoped_lock held(_mutex);
  return _version;
}

MachineSection MachineFile::section(std::string_view name) {
  auto machine = contents();
  const auto* value = machine->find(name);
  return MachineSection(std::string(name), MachineSection::Values(machine, value ? value->asDictionary() : nullptr));
}

Result<void> MachineFile::change(const Edit& edit) {
  auto held = lock();
  if (!held) return held.failure();
  auto version = read();
  if (!version) return version.failure();
  PropertyList edited = Dictionary((*version)->machine);
  edit(*edited.asDictionary());
  auto text = writePropertyList(edited);
  if (!text) return Failure{"write", _path, text.failure().why};
  auto written = _folder.write(fileName, *text);
  if (!written) return inFolder(written.failure());
  keepWritten(std::move(text).value(), std::move(*edited.asDictionary()));
  return {};
}

void MachineFile::keepWritten(std::string text, Dictionary machine) {
  if (whyWrong(machine)) return;
  auto version = std::make_shared<const Version>(Version{std::move(text), std::move(machine)});
  std::scoped_lock held(_mutex);
  _version = version;
  _stamp = FileStamp{};
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

Result<MachineFile::VersionRef> MachineFile::read() const {
  auto text = readText();
  if (!text) return text.failure();
  if (auto last = lastSeen(); last->text == *text) return last;
  auto machine = *text ? parse(**text) : Dictionary();
  if (!machine) return machine.failure();
  return std::make_shared<const Version>(Version{std::move(text).value(), std::move(machine).value()});
}

Result<std::optional<std::string>> MachineFile::readText() const {
  bool missing = !_folder.exists(fileName) && !_folder.readLink(fileName);
  if (missing) return std::optional<std::string>();
  auto text = _folder.read(fileName, ownFileLimits.bytes);
  if (!text) return inFolder(text.failure());
  return std::optional(std::move(text).value());
}

Result<MachineFile::Dictionary> MachineFile::parse(const std::string& text) const {
  auto list = parsePropertyList(text, ownFileLimits);
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

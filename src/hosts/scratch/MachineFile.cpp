// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/MachineFile.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <stdexcept>
#include <thread>
#include <utility>

#include "base/FileDescriptor.h"
#include "base/Text.h"
#include "hosts/scratch/KeyTable.h"

namespace tavisk {
namespace {

using namespace std::chrono_literals;

constexpr const char* fileName = "/machine.plist";
constexpr const char* lockName = "/machine.lock";
constexpr const char* rehearsal = "rehearse";
constexpr const char* settingName = "Machine";
constexpr std::chrono::milliseconds longestWait = 5s;  // for another run's lock
constexpr std::chrono::milliseconds longestWaitOfOtherThreads = 50ms;
constexpr std::chrono::milliseconds betweenTries = 1ms;

const KeyRow& rowOf(const std::string& place, std::string_view key) {
  const auto* row = findKey(place, key);
  if (!row) throw std::logic_error("no key: " + place + "/" + std::string(key));
  return *row;
}

/// The times of files go in steps of some milliseconds: what was written within the last step may be written again and
/// look the same.
bool tellsVersions(const std::optional<FileStamp>& stamp) {
  constexpr std::int64_t step = 20'000'000;  // nanoseconds; 10 ms at the slowest kernel clock
  const auto now = std::chrono::nanoseconds(std::chrono::system_clock::now().time_since_epoch()).count();
  return !stamp || std::abs(now - stamp->changed) > step;
}

/// Locks a file against other runs (flock(2)) until the descriptor is closed; it is made when it is missing.
Result<FileDescriptor> lockFile(const SystemRoot& root, const std::string& path, std::chrono::milliseconds patience) {
  auto file = root.open(path, O_RDONLY | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file;
  const auto deadline = std::chrono::steady_clock::now() + patience;
  while (::flock(file->number(), LOCK_EX | LOCK_NB) != 0) {
    if (errno != EWOULDBLOCK && errno != EINTR) return systemFailure("lock", path, errno);
    if (std::chrono::steady_clock::now() > deadline) return Failure{"lock", path, "another run keeps it locked"};
    std::this_thread::sleep_for(betweenTries);
  }
  return file;
}

void drain(const FileDescriptor& events) {
  std::array<char, 4096> unused{};
  while (::read(events.number(), unused.data(), unused.size()) > 0) continue;
}

/// Runs the work from the run loop whenever a file in the folder was written, moved in or out, or removed (inotify(7)).
Result<RunLoop::Registration> watchFolder(const std::string& folder, RunLoop& runLoop, std::function<void()> work) {
  constexpr auto mask = IN_CLOSE_WRITE | IN_MOVED_TO | IN_MOVED_FROM | IN_DELETE | IN_ONLYDIR;
  const int number = ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC);
  if (number < 0) return systemFailure("watch", folder, errno);
  const auto events = std::make_shared<FileDescriptor>(number);
  if (::inotify_add_watch(number, folder.c_str(), mask) < 0) return systemFailure("watch", folder, errno);
  return runLoop.watch(number, RunLoop::Readiness::readable, [events, work = std::move(work)] {
    drain(*events);
    work();
  });
}

}  // namespace

bool MachineSection::boolean(std::string_view key) const {
  const auto* value = find(key);
  return value ? *value->asBoolean() : defaultOf(key) == "true";
}

std::int64_t MachineSection::integer(std::string_view key) const {
  const auto* value = find(key);
  return value ? *value->asInteger() : leadingInteger(defaultOf(key));
}

std::string MachineSection::text(std::string_view key) const {
  const auto* value = find(key);
  return value ? *value->asString() : std::string(defaultOf(key));
}

std::optional<std::string> MachineSection::optionalText(std::string_view key) const {
  const auto* value = find(key);
  if (value) return *value->asString();
  if (const auto& otherwise = rowOf(_place, key).otherwise) return std::string(*otherwise);
  return std::nullopt;
}

MachineSection MachineSection::section(std::string_view key) const {
  const auto* value = find(key);
  return {placeUnder(rowOf(_place, key)), Values(_values, value ? value->asDictionary() : nullptr)};
}

std::vector<std::string> MachineSection::keys() const {
  std::vector<std::string> keys;
  if (!_values) return keys;
  for (const auto& [key, value] : *_values) keys.push_back(key);
  return keys;
}

std::string_view MachineSection::defaultOf(std::string_view key) const {
  const auto& row = rowOf(_place, key);
  if (!row.otherwise) throw std::logic_error("no default: " + _place + "/" + std::string(key));
  return *row.otherwise;
}

Result<std::unique_ptr<MachineFile>> MachineFile::open(const std::string& directory, EffectSink& effects) {
  std::unique_ptr<MachineFile> file(new MachineFile(directory, effects));
  if (const auto folder = file->_folder.open("/", O_RDONLY | O_DIRECTORY); !folder)
    return retold(folder.failure(), rehearsal, directory);
  const auto version = file->read();
  if (!version) return retold(version.failure(), rehearsal, version.failure().on);
  file->_version = *version;
  return file;
}

MachineFile::MachineFile(const std::string& directory, EffectSink& effects)
    : _directory(directory.substr(0, directory.find_last_not_of('/') + 1)),
      _path(_directory + fileName),
      _folder(directory),
      _effects(effects) {}

MachineFile::Contents MachineFile::contents() {
  const auto stamp = _folder.stamp(fileName);
  {
    const std::scoped_lock held(_mutex);
    if (stamp == _stamp) return Contents(_version, &_version->machine);
  }
  // What counts is when reading begins.
  const auto telling = tellsVersions(stamp) ? stamp : FileStamp{};
  if (const auto failure = keep(telling, read())) recordFailure(*failure, "the contents last read stand");
  const auto version = lastSeen();
  return Contents(version, &version->machine);
}

std::optional<Failure> MachineFile::keep(const std::optional<FileStamp>& stamp, const Result<VersionRef>& version) {
  const std::scoped_lock held(_mutex);
  // No stamp stands for absence alone.
  const bool isAbsence = version && !(*version)->text;
  _stamp = stamp || isAbsence ? stamp : FileStamp{};
  if (version) {
    _version = *version;
    _failure.reset();
    return std::nullopt;
  }
  const bool isKnown = _failure == version.failure();
  _failure = version.failure();
  return isKnown ? std::nullopt : _failure;
}

MachineFile::VersionRef MachineFile::lastSeen() const {
  const std::scoped_lock held(_mutex);
  return _version;
}

MachineSection MachineFile::section(std::string_view name) {
  return MachineSection("", contents()).section(name);
}

Result<void> MachineFile::change(const Edit& edit) {
  const auto held = lock();
  if (!held) return held.failure();
  const auto version = read();
  if (!version) return version.failure();
  PropertyList edited = Dictionary((*version)->machine);
  edit(*edited.asDictionary());
  auto text = writePropertyList(edited);
  if (!text) return retold(text.failure(), "write", _path);
  const auto written = _folder.write(fileName, *text);
  if (!written) return inFolder(written.failure());
  keepWritten(std::move(text).value(), std::move(*edited.asDictionary()));
  return {};
}

void MachineFile::keepWritten(std::string text, Dictionary machine) {
  if (whyWrong(machine)) return;
  const auto version = std::make_shared<const Version>(Version{std::move(text), std::move(machine)});
  const std::scoped_lock held(_mutex);
  _version = version;
  _stamp = FileStamp{};
}

RunLoop::Registration MachineFile::observeChanges(RunLoop& runLoop, Contents told, Observer observer) {
  auto compare = std::make_shared<std::function<void()>>([this, told, observer = std::move(observer)]() mutable {
    const auto now = contents();
    if (now == told || *now == *told) return;
    const auto before = std::exchange(told, now);
    observer(before, now);
  });
  auto watch = watchFolder(_directory, runLoop, [compare] { (*compare)(); });
  if (!watch) {
    recordFailure(watch.failure(), "changes that others make are not noticed");
    return {};
  }
  // What was written before the watch began makes no event.
  runLoop.post([first = std::weak_ptr(compare)] {
    if (const auto watched = first.lock()) (*watched)();
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
  const auto found = orAbsent(_folder.read(fileName, ownFileLimits.bytes));
  if (!found) return inFolder(found.failure());
  if (*found) return *found;
  const auto link = orAbsent(_folder.readLink(fileName));
  if (link && !*link) return std::optional<std::string>();
  // Another process has made it meanwhile; or it is a link that leads nowhere, which is no machine with nothing in it.
  auto text = _folder.read(fileName, ownFileLimits.bytes);
  if (!text) return inFolder(text.failure());
  return std::optional(std::move(text).value());
}

Result<MachineFile::Dictionary> MachineFile::parse(const std::string& text) const {
  auto list = parsePropertyList(text, ownFileLimits);
  if (!list) return retold(list.failure(), "read", _path);
  auto value = std::move(list).value();
  auto* machine = value.asDictionary();
  if (!machine) return Failure{"read", _path, "expected a dictionary"};
  if (const auto wrong = whyWrong(*machine)) return Failure{"read", _path, *wrong};
  return std::move(*machine);
}

Result<FileDescriptor> MachineFile::lock() const {
  const auto patience = std::this_thread::get_id() == _owner ? longestWait : longestWaitOfOtherThreads;
  auto file = lockFile(_folder, lockName, patience);
  if (!file) return inFolder(file.failure());
  return file;
}

void MachineFile::recordFailure(const Failure& failure, const std::string& note) {
  _effects.record({.setting = settingName, .outcome = Outcome::failed, .note = note, .failure = failure});
}

Failure MachineFile::inFolder(const Failure& failure) const {
  return retold(failure, failure.tried, _directory + failure.on);
}

}  // namespace tavisk

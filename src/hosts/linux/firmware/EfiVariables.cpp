// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/EfiVariables.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {
namespace {

constexpr std::size_t longestVariable = std::size_t{1} << 20U;
constexpr std::size_t attributesSize = 4;
constexpr unsigned modeWhenNew = 0644;
/// Kept without power, and readable before and after the start of the system.
constexpr std::uint64_t usualAttributes = 7;

constexpr std::string_view entryPrefix = "Boot";
constexpr std::array<std::string_view, 3> ownNames{"prev-lang:kbd", "boot-command", "target-mode"};

bool isBootEntry(const EfiVariableName& variable) {
  return variable.vendor == efiGlobalVendor && bootEntryNumber(variable.name);
}

bool mayBeWritten(const EfiVariableName& variable) {
  if (variable.vendor == efiOwnVendor) return std::ranges::find(ownNames, variable.name) != ownNames.end();
  if (variable.vendor == efiLoaderVendor) return variable.name == "LoaderEntryDefault";
  return isBootEntry(variable) || (variable.vendor == efiGlobalVendor && variable.name == "BootOrder");
}

/// Lifts the kernel's protection of a variable for as long as it lives.
class Unprotected {
 public:
  Unprotected(const SystemRoot& root, const std::string& path) {
    auto file = root.open(path, O_RDONLY | O_NONBLOCK);
    if (!file || ::ioctl(file->number(), FS_IOC_GETFLAGS, &_flags) != 0) return;
    if ((_flags & FS_IMMUTABLE_FL) == 0) return;
    const int lifted = _flags & ~FS_IMMUTABLE_FL;
    if (::ioctl(file->number(), FS_IOC_SETFLAGS, &lifted) == 0) _file = std::move(file).value();
  }
  ~Unprotected() {
    if (_file) ::ioctl(_file.number(), FS_IOC_SETFLAGS, &_flags);
  }
  Unprotected(const Unprotected&) = delete;
  Unprotected& operator=(const Unprotected&) = delete;

 private:
  FileDescriptor _file;
  int _flags = 0;
};

/// In a single call: the kernel takes each as a whole variable.
Result<void> writeOnce(const FileDescriptor& file, std::string_view contents, const std::string& path) {
  ssize_t count = 0;
  do count = ::write(file.number(), contents.data(), contents.size());
  while (count < 0 && errno == EINTR);
  if (count < 0) return systemFailure("write", path, errno);
  if (static_cast<std::size_t>(count) != contents.size()) return Failure{"write", path, "it was not taken whole"};
  return {};
}

/// Where variables are plain files an older, longer value still shows its end; the kernel's are never longer.
Result<void> cutTo(const FileDescriptor& file, std::size_t size, const std::string& path) {
  struct stat status {};
  const auto wanted = static_cast<off_t>(size);
  if (::fstat(file.number(), &status) != 0 || status.st_size <= wanted) return {};
  if (::ftruncate(file.number(), wanted) != 0) return systemFailure("truncate", path, errno);
  return {};
}

}  // namespace

std::string bootEntryName(std::uint16_t number) {
  constexpr std::size_t digitCount = 4;
  return std::string(entryPrefix) + upperCased(hexDigits(number, digitCount));
}

std::optional<std::uint16_t> bootEntryNumber(std::string_view name) {
  if (!name.starts_with(entryPrefix)) return std::nullopt;
  const auto number = parseNumber<std::uint16_t>(name.substr(entryPrefix.size()), 16);
  return number && bootEntryName(*number) == name ? number : std::nullopt;
}

struct EfiVariables::Stored {
  std::uint64_t attributes;
  std::string value;
};

std::string EfiVariables::pathOf(const EfiVariableName& variable) {
  return std::string(folder) + "/" + variable.name + "-" + variable.vendor;
}

Support EfiVariables::support() const {
  const auto isUefi = _root.isThere("/sys/firmware/efi");
  if (!isUefi) return isUefi.failure();
  if (!*isUefi)
    return NotSupported{{"read", "the firmware's variables", "this machine was not started by UEFI firmware"}};
  const auto all = orEmpty(_root.list(folder));
  if (!all) return all.failure();
  if (all->empty()) return NotSupported{{"read", folder, "no variables are shown here; is efivarfs mounted?"}};
  return std::nullopt;
}

Result<std::vector<std::string>> EfiVariables::names(std::string_view vendor) const {
  const auto all = orEmpty(_root.list(folder));
  if (!all) return all.failure();
  const auto ending = "-" + std::string(vendor);
  std::vector<std::string> names;
  for (const auto& name : *all)
    if (name.ends_with(ending)) names.push_back(name.substr(0, name.size() - ending.size()));
  return names;
}

/// The kernel shows a variable that was made and not yet written as an empty file.
Result<std::optional<EfiVariables::Stored>> EfiVariables::find(const std::string& path) const {
  const auto contents = orEmpty(_root.read(path, longestVariable));
  if (!contents) return contents.failure();
  if (contents->empty()) return std::nullopt;
  std::string_view rest = *contents;
  const auto attributes = takeNumber(rest, attributesSize);
  if (!attributes) return Failure{"read", path, "too short for a variable"};
  return Stored{*attributes, std::string(rest)};
}

Result<std::optional<std::string>> EfiVariables::read(const EfiVariableName& variable) const {
  const auto found = find(pathOf(variable));
  if (!found) return found.failure();
  return *found ? std::optional((*found)->value) : std::nullopt;
}

Result<void> EfiVariables::write(const EfiVariableName& variable, std::string_view value) const {
  const auto path = pathOf(variable);
  if (!mayBeWritten(variable)) return Failure{"write", path, "not one of the variables that are changed here"};
  const auto before = find(path);
  if (!before) return before.failure();
  if (*before && isBootEntry(variable)) return Failure{"write", path, "another entry is there"};
  std::string contents;
  appendNumber(contents, *before ? (*before)->attributes : usualAttributes, attributesSize);
  return writeFile(path, contents.append(value), !*before);
}

/// A new file that could not be written is taken away: tools would take it for a variable. The kernel may protect it
/// from its making.
Result<void> EfiVariables::writeFile(const std::string& path, std::string_view contents, bool isNew) const {
  const Unprotected meanwhile(_root, path);
  auto file = _root.open(path, O_WRONLY | O_NONBLOCK);
  if (!file && isNew && isAbsent(file.failure())) file = _root.open(path, O_WRONLY | O_CREAT | O_EXCL, modeWhenNew);
  if (!file) return file.failure();
  auto written = writeOnce(*file, contents, path);
  if (written) return cutTo(*file, contents.size(), path);
  if (isNew) {
    const Unprotected removable(_root, path);
    static_cast<void>(_root.remove(path));
  }
  return written;
}

Result<void> EfiVariables::removeEntry(const EfiVariableName& variable, std::string_view value) const {
  const auto path = pathOf(variable);
  const auto present = read(variable);
  if (!present) return present.failure();
  if (!isBootEntry(variable) || *present != value) return Failure{"remove", path, "it is not the entry that was made"};
  return _root.remove(path);
}

}  // namespace tavisk

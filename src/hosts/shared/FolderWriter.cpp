// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/FolderWriter.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <random>

#include "hosts/shared/OpenBeneath.h"

namespace tavisk {
namespace {

constexpr const char* temporaryPrefix = ".tavisk-";
constexpr const char* labelAttribute = "security.selinux";
constexpr int enoughTries = 16;

std::string temporaryName() {
  std::random_device random;
  return temporaryPrefix + std::to_string(random()) + std::to_string(random());
}

}  // namespace

/// A file under a temporary name, locked as long as it is open. The name goes with it; a rename has taken it before.
struct FolderWriter::Temporary {
  Temporary(const FileDescriptor& inFolder, std::string itsName, FileDescriptor opened)
      : folder(&inFolder), name(std::move(itsName)), file(std::move(opened)) {}
  Temporary(Temporary&&) = default;
  Temporary(const Temporary&) = delete;
  Temporary& operator=(Temporary&&) = delete;
  Temporary& operator=(const Temporary&) = delete;
  ~Temporary() {
    if (file) ::unlinkat(folder->number(), name.c_str(), 0);
  }

  const FileDescriptor* folder;
  std::string name;
  FileDescriptor file;
};

Failure FolderWriter::failure(const char* tried) const {
  return systemFailure(tried, _path, errno);
}

Result<void> FolderWriter::writeFile(const std::string& name, std::string_view contents, unsigned modeWhenNew) {
  removeLeftovers();
  const auto temporary = makeTemporary();
  if (!temporary) return temporary.failure();
  if (auto filled = fill(*temporary, name, contents, modeWhenNew); !filled) return filled;
  if (auto placed = putInPlace(*temporary, name, contents); !placed) return placed;
  return syncFolder();
}

Result<void> FolderWriter::writeLink(const std::string& name, const std::string& target) {
  removeLeftovers();
  // A link cannot be locked: another run may take ours for a leftover, and then it is made again.
  for (int tries = 0; tries < enoughTries; ++tries) {
    const auto temporary = temporaryName();
    if (::symlinkat(target.c_str(), _folder.number(), temporary.c_str()) != 0) return failure("make link");
    if (::renameat(_folder.number(), temporary.c_str(), _folder.number(), name.c_str()) == 0) return syncFolder();
    if (errno == ENOENT) continue;
    const auto refused = failure("rename");
    ::unlinkat(_folder.number(), temporary.c_str(), 0);
    return refused;
  }
  return Failure{"rename", _path, "other runs keep removing the temporary link"};
}

Result<void> FolderWriter::remove(const std::string& name) {
  if (::unlinkat(_folder.number(), name.c_str(), 0) == 0) return syncFolder();
  if (errno == ENOENT) return {};
  return failure("remove");
}

void FolderWriter::removeLeftovers() {
  const auto names = namesIn(_folder, _path);
  if (!names) return;  // the write itself will tell
  for (const auto& name : *names) {
    if (name.starts_with(temporaryPrefix)) removeIfLeft(name);
  }
}

void FolderWriter::removeIfLeft(const std::string& name) {
  const auto file = openNamed(_folder, name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK);
  const bool isLink = !file && file.failure().code == std::errc::too_many_symbolic_link_levels;
  const bool isFree = file && ::flock(file->number(), LOCK_EX | LOCK_NB) == 0;
  if (isLink || isFree) ::unlinkat(_folder.number(), name.c_str(), 0);
}

Result<FolderWriter::Temporary> FolderWriter::makeTemporary() {
  for (int tries = 0; tries < enoughTries; ++tries) {
    const auto name = temporaryName();
    auto opened = openNamed(_folder, name, O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW, 0600);
    if (!opened && opened.failure().code == std::errc::file_exists) continue;
    if (!opened) return retold(opened.failure(), "make temporary file beside", _path);
    Temporary made(_folder, name, std::move(opened).value());
    struct stat status {};
    const bool isHeld = ::flock(made.file.number(), LOCK_EX | LOCK_NB) == 0;
    if (!isHeld && errno != EWOULDBLOCK) return failure("lock temporary file beside");
    // Between the two calls another run may have taken it for a leftover.
    if (isHeld && ::fstat(made.file.number(), &status) == 0 && status.st_nlink > 0) return made;
  }
  return Failure{"make temporary file beside", _path, "other runs keep removing it"};
}

Result<void> FolderWriter::fill(const Temporary& temporary, const std::string& name, std::string_view contents,
                                unsigned modeWhenNew) {
  if (auto taken = takeOver(temporary.file, name, modeWhenNew); !taken) return taken;
  if (auto written = writeAll(temporary.file, contents, _path); !written) return written;
  if (::fsync(temporary.file.number()) != 0) return failure("flush");
  return {};
}

Result<void> FolderWriter::takeOver(const FileDescriptor& fresh, const std::string& name, unsigned modeWhenNew) {
  struct stat old {};
  if (::fstatat(_folder.number(), name.c_str(), &old, AT_SYMLINK_NOFOLLOW) != 0) {
    if (errno != ENOENT) return failure("look at");
    if (::fchmod(fresh.number(), modeWhenNew) != 0) return failure("set mode of");
    return {};
  }
  if (!S_ISREG(old.st_mode)) return Failure{"write", _path, "not a regular file"};
  struct stat made {};
  if (::fstat(fresh.number(), &made) != 0) return failure("look at");
  const bool hasSameOwner = old.st_uid == made.st_uid && old.st_gid == made.st_gid;
  if (!hasSameOwner && ::fchown(fresh.number(), old.st_uid, old.st_gid) != 0) return failure("keep owner of");
  if (::fchmod(fresh.number(), old.st_mode & 07777U) != 0) return failure("keep mode of");
  return keepLabel(fresh, name);
}

Result<void> FolderWriter::keepLabel(const FileDescriptor& fresh, const std::string& name) {
  const auto old = openNamed(_folder, name, O_RDONLY | O_NOFOLLOW | O_NONBLOCK);
  if (!old) return retold(old.failure(), "look at", _path);
  std::array<char, 4096> label{};
  const auto size = ::fgetxattr(old->number(), labelAttribute, label.data(), label.size());
  const bool hasNone = size == 0 || errno == ENODATA || errno == ENOTSUP;
  if (size <= 0) return hasNone ? Result<void>() : failure("keep label of");
  if (::fsetxattr(fresh.number(), labelAttribute, label.data(), static_cast<std::size_t>(size), 0) != 0)
    return failure("keep label of");
  return {};
}

Result<void> FolderWriter::putInPlace(const Temporary& temporary, const std::string& name, std::string_view contents) {
  if (::renameat(_folder.number(), temporary.name.c_str(), _folder.number(), name.c_str()) == 0) return {};
  if (errno == EBUSY) return rewrite(name, contents);  // another file is mounted there
  return failure("rename");
}

Result<void> FolderWriter::rewrite(const std::string& name, std::string_view contents) {
  const auto file = openNamed(_folder, name, O_RDWR | O_NOFOLLOW | O_NONBLOCK);
  if (!file) return retold(file.failure(), "open", _path);
  const auto old = readAll(*file, std::string::npos, _path);
  if (!old) return old.failure();
  auto done = overwrite(*file, contents);
  const auto back = done ? Result<void>() : overwrite(*file, *old);
  if (back) return done;
  auto why = done.failure();
  why.why += "; the old contents are not back: " + describe(back.failure());
  return why;
}

Result<void> FolderWriter::overwrite(const FileDescriptor& file, std::string_view contents) {
  if (::lseek(file.number(), 0, SEEK_SET) != 0) return failure("go to the beginning of");
  if (auto written = writeAll(file, contents, _path); !written) return written;
  if (::ftruncate(file.number(), static_cast<off_t>(contents.size())) != 0) return failure("cut");
  if (::fsync(file.number()) != 0) return failure("flush");
  return {};
}

Result<void> FolderWriter::syncFolder() {
  if (::fsync(_folder.number()) == 0) return {};
  auto refused = failure("flush folder of");
  refused.why += "; the new value may not survive a power cut";
  return refused;
}

}  // namespace tavisk

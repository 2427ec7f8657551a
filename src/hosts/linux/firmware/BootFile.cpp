// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/BootFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {
namespace {

constexpr std::size_t headSize = 65536;
constexpr std::size_t placeOfHeaderPlace = 0x3C;
constexpr std::size_t fileHeaderSize = 20;
constexpr std::size_t placeOfSubsystem = 68;
constexpr std::uint64_t efiApplication = 10;
constexpr std::uint64_t magicOf64Bits = 0x20B;
constexpr std::uint64_t magicOf32Bits = 0x10B;
/// The count of the directories stands before them; the certificate table is the fifth, 8 bytes each.
constexpr std::size_t placeOfCount32 = 92;
constexpr std::size_t placeOfCount64 = 108;
constexpr std::size_t certificateTable = 4;
constexpr std::size_t directorySize = 8;

std::optional<std::uint64_t> numberAt(std::string_view bytes, std::size_t place, std::size_t width) {
  if (place > bytes.size()) return std::nullopt;
  bytes.remove_prefix(place);
  return takeNumber(bytes, width);
}

/// The file's beginning; a device or a FIFO is only looked at.
Result<std::string> headOf(const SystemRoot& root, const std::string& path) {
  struct stat status {};
  const auto seen = root.open(path, O_PATH);
  if (!seen) return seen.failure();
  if (::fstat(seen->number(), &status) != 0 || !S_ISREG(status.st_mode))
    return Failure{"read", path, "not a regular file"};
  const auto file = root.open(path, O_RDONLY | O_NONBLOCK | O_NOCTTY);
  if (!file) return file.failure();
  std::string head(headSize, '\0');
  const auto count = ::read(file->number(), head.data(), head.size());
  if (count < 0) return systemFailure("read", path, errno);
  head.resize(static_cast<std::size_t>(count));
  return head;
}

}  // namespace

std::optional<BootFile> parseBootFile(std::string_view head) {
  const auto header = numberAt(head, placeOfHeaderPlace, 4);
  if (!head.starts_with("MZ") || !header || *header > head.size()) return std::nullopt;
  head.remove_prefix(*header);
  if (!head.starts_with(std::string_view("PE\0\0", 4)) || head.size() < 4 + fileHeaderSize) return std::nullopt;
  const auto optional = head.substr(4 + fileHeaderSize);
  const auto magic = numberAt(optional, 0, 2).value_or(0);
  if (magic != magicOf32Bits && magic != magicOf64Bits) return std::nullopt;
  if (numberAt(optional, placeOfSubsystem, 2) != efiApplication) return std::nullopt;
  const auto placeOfCount = magic == magicOf64Bits ? placeOfCount64 : placeOfCount32;
  const auto count = numberAt(optional, placeOfCount, 4).value_or(0);
  const auto placeOfSize = placeOfCount + 4 + certificateTable * directorySize + 4;
  return BootFile{count > certificateTable && numberAt(optional, placeOfSize, 4).value_or(0) != 0};
}

Result<BootFile> readBootFile(const SystemRoot& root, const std::string& path) {
  const auto head = headOf(root, path);
  if (!head) return head.failure();
  const auto file = parseBootFile(*head);
  if (!file) return Failure{"start", path, "not a program for UEFI firmware"};
  return *file;
}

}  // namespace tavisk

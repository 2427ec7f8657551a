// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/BlockProbe.h"

#include <blkid/blkid.h>
#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <utility>

#include "base/Text.h"

namespace tavisk {
namespace {

/// The error of a call of libblkid, which leaves why it failed in errno alone, and only where a system call did;
/// `otherwise` stands for other reasons. 0 when the call was a success.
template <typename Call>
int errorOf(const Call& call, int otherwise) {
  errno = 0;
  if (call()) return 0;
  return errno == 0 ? otherwise : errno;
}

/// A device that libblkid looks at.
class Probe {
  using Handle = std::unique_ptr<blkid_struct_probe, decltype(&::blkid_free_probe)>;

 public:
  static Result<Probe> open(const SystemRoot& root, const std::string& node) {
    auto file = root.open(node, O_RDONLY | O_NONBLOCK | O_NOCTTY);
    if (!file) return file.failure();
    struct stat status {};
    if (::fstat(file->number(), &status) != 0 || !(S_ISBLK(status.st_mode) || S_ISREG(status.st_mode)))
      return Failure{"read", node, "not a block device"};
    Handle probe(::blkid_new_probe(), ::blkid_free_probe);
    const auto isTaken = [&] { return probe && ::blkid_probe_set_device(probe.get(), file->number(), 0, 0) == 0; };
    if (const int error = errorOf(isTaken, ENOMEM); error != 0) return systemFailure("read", node, error);
    return Probe(std::move(file).value(), std::move(probe));
  }

  blkid_probe handle() const { return _probe.get(); }

  std::optional<std::string> value(const char* name) const {
    const char* data = nullptr;
    if (::blkid_probe_lookup_value(_probe.get(), name, &data, nullptr) != 0) return std::nullopt;
    return std::string(data);
  }

 private:
  Probe(FileDescriptor file, Handle probe) : _file(std::move(file)), _probe(std::move(probe)) {}

  FileDescriptor _file;
  Handle _probe;
};

/// What libblkid has no text for is empty.
std::string textOrNone(const char* value) {
  return value ? value : "";
}

std::string typeOf(blkid_partition partition) {
  if (const char* guid = ::blkid_partition_get_type_string(partition)) return guid;
  return "0x" + hexDigits(static_cast<unsigned>(::blkid_partition_get_type(partition)));
}

PartitionFacts factsOf(blkid_partition partition) {
  PartitionFacts facts;
  facts.number = ::blkid_partition_get_partno(partition);
  facts.start = static_cast<std::uint64_t>(::blkid_partition_get_start(partition));
  facts.size = static_cast<std::uint64_t>(::blkid_partition_get_size(partition));
  facts.uuid = textOrNone(::blkid_partition_get_uuid(partition));
  facts.type = typeOf(partition);
  facts.name = textOrNone(::blkid_partition_get_name(partition));
  return facts;
}

}  // namespace

const PartitionFacts* PartitionTable::find(int number) const {
  const auto found = std::ranges::find(partitions, number, &PartitionFacts::number);
  return found == partitions.end() ? nullptr : &*found;
}

Result<VolumeFacts> probeVolume(const SystemRoot& root, const std::string& node) {
  const auto probe = Probe::open(root, node);
  if (!probe) return probe.failure();
  auto* handle = probe->handle();
  ::blkid_probe_enable_superblocks(handle, 1);
  ::blkid_probe_set_superblocks_flags(
      handle, BLKID_SUBLKS_LABEL | BLKID_SUBLKS_UUID | BLKID_SUBLKS_TYPE | BLKID_SUBLKS_USAGE | BLKID_SUBLKS_MAGIC);
  constexpr int failed = -1;  // 1: nothing found; -2: more than one type
  const int error = errorOf([&] { return ::blkid_do_safeprobe(handle) != failed; }, EIO);
  if (error != 0) return systemFailure("read", node, error);
  return VolumeFacts{probe->value("TYPE"), probe->value("USAGE"), probe->value("LABEL"), probe->value("UUID"),
                     probe->value("BOOT_SYSTEM_ID")};
}

Result<PartitionTable> probePartitionTable(const SystemRoot& root, const std::string& node) {
  const auto probe = Probe::open(root, node);
  if (!probe) return probe.failure();
  ::blkid_probe_enable_superblocks(probe->handle(), 0);
  ::blkid_probe_enable_partitions(probe->handle(), 1);
  blkid_partlist list = nullptr;
  constexpr int noTable = 0;
  const auto isListed = [&] {
    list = ::blkid_probe_get_partitions(probe->handle());
    return list != nullptr;
  };
  if (const int error = errorOf(isListed, noTable); error != 0) return systemFailure("read", node, error);
  PartitionTable result;
  auto* table = list ? ::blkid_partlist_get_table(list) : nullptr;
  if (!table) return result;
  result.type = textOrNone(::blkid_parttable_get_type(table));
  result.uuid = textOrNone(::blkid_parttable_get_id(table));
  for (int place = 0; place < ::blkid_partlist_numof_partitions(list); ++place)
    result.partitions.push_back(factsOf(::blkid_partlist_get_partition(list, place)));
  return result;
}

}  // namespace tavisk

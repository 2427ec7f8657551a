// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/BlockProbe.h"

#include <blkid/blkid.h>
#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <memory>

#include "base/Result.h"

namespace tavisk {
namespace {

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
    errno = 0;
    if (!probe || ::blkid_probe_set_device(probe.get(), file->number(), 0, 0) != 0)
      return systemFailure("read", node, errno == 0 ? ENOMEM : errno);
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

std::string text(const char* value) {
  return !value ? "" : value;
}

std::string typeOf(blkid_partition partition) {
  if (const char* guid = ::blkid_partition_get_type_string(partition)) return guid;
  std::array<char, 16> byte{};
  std::snprintf(byte.data(), byte.size(), "0x%x", static_cast<unsigned>(::blkid_partition_get_type(partition)));
  return byte.data();
}

PartitionFacts factsOf(blkid_partition partition) {
  PartitionFacts facts;
  facts.number = ::blkid_partition_get_partno(partition);
  facts.start = static_cast<std::uint64_t>(::blkid_partition_get_start(partition));
  facts.size = static_cast<std::uint64_t>(::blkid_partition_get_size(partition));
  facts.uuid = text(::blkid_partition_get_uuid(partition));
  facts.type = typeOf(partition);
  facts.name = text(::blkid_partition_get_name(partition));
  return facts;
}

}  // namespace

const PartitionFacts* PartitionTable::find(int number) const {
  const auto found =
      std::ranges::find_if(partitions, [&](const PartitionFacts& partition) { return partition.number == number; });
  return found == partitions.end() ? nullptr : &*found;
}

Result<VolumeFacts> probeVolume(const SystemRoot& root, const std::string& node) {
  const auto probe = Probe::open(root, node);
  if (!probe) return probe.failure();
  auto* handle = probe->handle();
  ::blkid_probe_enable_superblocks(handle, 1);
  ::blkid_probe_set_superblocks_flags(
      handle, BLKID_SUBLKS_LABEL | BLKID_SUBLKS_UUID | BLKID_SUBLKS_TYPE | BLKID_SUBLKS_USAGE | BLKID_SUBLKS_MAGIC);
  errno = 0;
  constexpr int failed = -1;  // 1: nothing found; -2: more than one type
  if (::blkid_do_safeprobe(handle) == failed) return systemFailure("read", node, errno == 0 ? EIO : errno);
  return VolumeFacts{probe->value("TYPE"), probe->value("USAGE"), probe->value("LABEL"), probe->value("UUID"),
                     probe->value("BOOT_SYSTEM_ID")};
}

Result<PartitionTable> probePartitionTable(const SystemRoot& root, const std::string& node) {
  const auto probe = Probe::open(root, node);
  if (!probe) return probe.failure();
  ::blkid_probe_enable_superblocks(probe->handle(), 0);
  ::blkid_probe_enable_partitions(probe->handle(), 1);
  errno = 0;
  const auto list = ::blkid_probe_get_partitions(probe->handle());
  if (!list && errno != 0) return systemFailure("read", node, errno);
  PartitionTable result;
  const auto table = !list ? nullptr : ::blkid_partlist_get_table(list);
  if (!table) return result;
  result.type = text(::blkid_parttable_get_type(table));
  result.uuid = text(::blkid_parttable_get_id(table));
  for (int place = 0; place < ::blkid_partlist_numof_partitions(list); ++place)
    result.partitions.push_back(factsOf(::blkid_partlist_get_partition(list, place)));
  return result;
}

}  // namespace tavisk

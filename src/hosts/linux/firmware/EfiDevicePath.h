// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

/// One step of a device path (UEFI 2.10, section 10.3).
struct EfiPathNode {
  std::uint8_t type = 0;
  std::uint8_t subtype = 0;
  std::string data;  ///< without the header

  bool operator==(const EfiPathNode&) const = default;
};

/// Where firmware finds something: node after node.
using EfiDevicePath = std::vector<EfiPathNode>;

/// The first path of a list, up to its end node; absent when the bytes are no such list.
std::optional<EfiDevicePath> parseDevicePath(std::string_view bytes);
/// With the end node.
std::string bytesOf(const EfiDevicePath& path);

/// A partition as firmware knows it. It is told apart by its identity alone.
struct EfiPartition {
  std::string uuid;  ///< GPT: a GUID in small letters; MBR: the disk's signature and the number, "1badd00d-02"
  std::uint32_t number = 0;
  std::uint64_t start = 0;  ///< in the disk's logical blocks
  std::uint64_t size = 0;   ///< in the disk's logical blocks
};

/// Absent when the identity is none that firmware could know.
std::optional<EfiPathNode> partitionNode(const EfiPartition& partition);
/// A file by its full path, "\EFI\BOOT\BOOTX64.EFI".
EfiPathNode fileNode(std::string_view path);

/// The same path with slashes, as this system names it.
std::string withSlashes(std::string file);

/// What a path says; absent when it does not say it.
std::optional<EfiPartition> partitionOf(const EfiDevicePath& path);
std::optional<std::string> fileOf(const EfiDevicePath& path);

/// The way to another machine: by a network interface, whatever the protocol. A partition that is reached over it, as
/// by iSCSI, is a disk's.
struct EfiNetworkPath {
  std::string hardwareAddress;        ///< "52:54:00:12:34:56"
  std::optional<std::string> server;  ///< an address
  std::optional<std::string> uri;
};
std::optional<EfiNetworkPath> networkPathOf(const EfiDevicePath& path);

/// Whether firmware starts something by the old rules of the boot sector.
bool isLegacyBoot(const EfiDevicePath& path);

/// "HD(2,GPT,1111...,0x800,0x20000)/File(\boot.efi)"; other nodes as "Path(TYPE,SUBTYPE,BYTES)".
std::string textOf(const EfiDevicePath& path);

}  // namespace tavisk

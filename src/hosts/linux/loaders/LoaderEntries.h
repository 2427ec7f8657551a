// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

/// What a loader that reads boot entries can start (UAPI.1, boot loader entries; systemd-boot(7)).
struct LoaderEntry {
  std::string id = {};  ///< the name of its file, with its ending
  std::string title = {};
  std::string sortKey = {};
  std::string machineId = {};
  std::string version = {};
  std::string program = {};       ///< on the entry's partition: a kernel, or what is started in its place
  std::string commandLine = {};   ///< of the kernel
  bool isKernel = false;          ///< the program is one, by the entry's word
  std::string volume = {};        ///< where the entry and its program are; for whoever collects entries
  std::string architecture = {};  ///< "x64", "aa64"; empty: any
  bool hasFailed = false;         ///< its tries are used up: the name ends in "+0" or "+0-N"
};

/// Whether quotes around a value are a part of it, as they are for GRUB.
enum class Quotes { kept, removed };

/// An entry of type 1, "loader/entries/ID"; absent when it starts nothing.
std::optional<LoaderEntry> parseLoaderEntry(std::string id, std::string_view text, Quotes quotes);

/// The pattern that "loader/loader.conf" gives for the entry to start; empty: none.
std::string defaultEntryIn(std::string_view loaderConfiguration);
/// Whether it has "preferred", which since version 258 goes before all patterns.
bool hasPreferredEntry(std::string_view loaderConfiguration);

/// In the order in which systemd-boot shows them.
void sortAsShown(std::vector<LoaderEntry>& entries);

/// The entry that systemd-boot starts: the first that one of the patterns (glob(7)) names, tried one after the other,
/// or else the first of all that has not failed. Null when there is none. Entries in the order in which they are shown.
const LoaderEntry* startedOf(const std::vector<LoaderEntry>& entries, const std::vector<std::string>& patterns);

/// Less than, equal to or greater than 0 (UAPI.10, the format of versions).
int compareVersions(std::string_view left, std::string_view right);

}  // namespace tavisk

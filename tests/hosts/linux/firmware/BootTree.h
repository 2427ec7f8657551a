// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <string>
#include <vector>

#include "hosts/linux/disks/DiskTree.h"
#include "hosts/linux/firmware/BootEntries.h"
#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {

inline std::string fromHex(std::string_view digits) {
  std::string bytes;
  for (std::size_t i = 0; i + 1 < digits.size(); i += 2)
    bytes.push_back(static_cast<char>(std::stoi(std::string(digits.substr(i, 2)), nullptr, 16)));
  return bytes;
}

/// The beginning of a program: 10 is the subsystem of those that firmware starts, the fifth directory its signature.
inline std::string firmwareProgram(bool is64 = true, unsigned subsystem = 10, unsigned directories = 16,
                                   std::uint64_t signatureSize = 0) {
  std::string bytes = "MZ" + std::string(58, '\0') + std::string("\x40\0\0\0PE\0\0", 8) + std::string(20, '\0');
  std::string optional(is64 ? 108 : 92, '\0');
  optional.replace(0, 2, is64 ? "\x0b\x02" : "\x0b\x01");
  optional[68] = static_cast<char>(subsystem);
  appendNumber(optional, directories, 4);
  for (unsigned i = 0; i < directories; ++i) appendNumber(optional, i == 4 ? signatureSize << 32U : 0, 8);
  return bytes + optional;
}

/// A machine made of files whose firmware keeps variables.
class BootTree : public DiskTree {
 public:
  static constexpr const char* variables = "/sys/firmware/efi/efivars";
  static std::string pathOf(const std::string& name) { return EfiVariables::pathOf({name}); }

  void setVariable(const std::string& name, const std::string& value) {
    write(pathOf(name), std::string("\7\0\0\0", 4) + value);
  }
  void setOrder(const std::vector<std::uint16_t>& order) {
    std::string bytes;
    for (const auto number : order) appendNumber(bytes, number, 2);
    setVariable("BootOrder", bytes);
  }
  void setEntry(std::uint16_t number, const EfiDevicePath& path, std::uint32_t attributes = EfiLoadOption::active) {
    setVariable(bootEntryName(number), bytesOf(EfiLoadOption{attributes, "other", bytesOf(path), ""}));
  }

  /// Every file of the folder of variables.
  std::map<std::string, std::string> allVariables() const {
    std::map<std::string, std::string> all;
    for (const auto& file : std::filesystem::directory_iterator(at(variables)))
      all[file.path().filename()] = contentsOf(file.path());
    return all;
  }
};

}  // namespace tavisk

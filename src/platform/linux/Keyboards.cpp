// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/Keyboards.h"

#include <algorithm>
#include <charconv>
#include <cstdint>

#include "platform/Text.h"
#include "platform/linux/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* devices = "/sys/class/input/";

std::string valueOf(const SystemRoot& root, const std::string& file) {
  return readKernelFile(root, file).valueOr("");
}

/// Whether it has the keys Escape to D, bits 1 to 31: by these udev knows keyboards from buttons too.
bool hasLetters(const SystemRoot& root, const std::string& device) {
  constexpr std::uint64_t letters = 0xFFFF'FFFE;
  const auto words = split(valueOf(root, device + "/capabilities/key"), " ");
  if (words.empty()) return false;
  std::uint64_t keys = 0;
  const auto& last = words.back();
  std::from_chars(last.data(), last.data() + last.size(), keys, 16);
  return (keys & letters) == letters;
}

/// Vendor and product of the USB keyboards that management controllers have, where their names do not say so.
constexpr std::string_view controllersOwn[] = {"046b:ff10", "0557:2221", "0557:2419", "0624:0249", "03f0:7029"};

bool isOfController(const SystemRoot& root, const std::string& device) {
  if (lowerCased(valueOf(root, device + "/name")).find("virtual") != std::string::npos) return true;
  const auto id = valueOf(root, device + "/id/vendor") + ":" + valueOf(root, device + "/id/product");
  return std::ranges::find(controllersOwn, id) != std::end(controllersOwn);
}

}  // namespace

std::vector<std::string> keyboards(const SystemRoot& root) {
  std::vector<std::string> found;
  for (const auto& name : root.list(devices).valueOr({})) {
    const auto device = devices + name;
    if (name.starts_with("input") && hasLetters(root, device) && !isOfController(root, device)) found.push_back(device);
  }
  return found;
}

Result<bool> isInhibited(const SystemRoot& root, const std::string& keyboard) {
  const auto value = readKernelFile(root, keyboard + "/inhibited");
  if (!value) return value.failure();
  return *value != "0";
}

Result<void> setInhibited(const SystemRoot& root, const std::string& keyboard, bool inhibited) {
  return writeKernelFile(root, keyboard + "/inhibited", inhibited ? "1" : "0");
}

}  // namespace tavisk

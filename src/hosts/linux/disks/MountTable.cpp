// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/MountTable.h"

#include <algorithm>
#include <numeric>
#include <optional>
#include <unordered_set>
#include <utility>

#include "base/Path.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t tableLimit = std::size_t{64} << 20U;

/// The text up to the next separator, which is taken off with it.
std::string_view takeField(std::string_view& text, char separator) {
  const auto length = std::min(text.find(separator), text.size());
  const auto field = text.substr(0, length);
  text.remove_prefix(std::min(length + 1, text.size()));
  return field;
}

template <typename Number>
Number takeNumber(std::string_view& text, char separator) {
  return parseNumber<Number>(takeField(text, separator)).value_or(0);
}

bool isOctal(std::string_view digits) {
  return digits.size() == 3 && digits.find_first_not_of("01234567") == std::string_view::npos;
}

/// The kernel writes blanks, newlines and backslashes as \040, \012 and \134.
std::string unescaped(std::string_view text) {
  std::string plain;
  plain.reserve(text.size());
  while (!text.empty()) {
    if (text.front() == '\\' && isOctal(text.substr(1, 3))) {
      plain += static_cast<char>((text[1] - '0') * 64 + (text[2] - '0') * 8 + (text[3] - '0'));
      text.remove_prefix(4);
    } else {
      plain += text.front();
      text.remove_prefix(1);
    }
  }
  return plain;
}

bool hasOption(std::string_view options, std::string_view wanted) {
  while (!options.empty())
    if (takeField(options, ',') == wanted) return true;
  return false;
}

std::optional<Mount> mountFrom(std::string_view line) {
  const auto middle = line.find(" - ");
  if (middle == std::string_view::npos) return std::nullopt;
  auto first = line.substr(0, middle);
  auto last = line.substr(middle + 3);
  Mount mount;
  mount.id = takeNumber<std::uint64_t>(first, ' ');
  mount.parent = takeNumber<std::uint64_t>(first, ' ');
  mount.device = DeviceNumber::parse(takeField(first, ' '));
  mount.root = unescaped(takeField(first, ' '));
  mount.point = unescaped(takeField(first, ' '));
  mount.type = unescaped(takeField(last, ' '));
  mount.source = unescaped(takeField(last, ' '));
  mount.options = unescaped(takeField(last, ' '));
  mount.readOnly = hasOption(takeField(first, ' '), "ro") || hasOption(mount.options, "ro");
  if (!mount.point.starts_with('/')) return std::nullopt;
  return mount;
}

}  // namespace

DeviceNumber DeviceNumber::parse(std::string_view text) {
  if (text.find(':') == std::string_view::npos) return {};
  const auto major = takeNumber<unsigned>(text, ':');
  return {major, parseNumber<unsigned>(text).value_or(0)};
}

Result<MountTable> MountTable::read(const SystemRoot& root) {
  const auto text = root.read(file, tableLimit);
  if (!text) return text.failure();
  return MountTable(*text);
}

MountTable::MountTable(std::string_view mountinfo) {
  while (!mountinfo.empty())
    if (auto mount = mountFrom(takeField(mountinfo, '\n'))) _mounts.push_back(std::move(*mount));
  for (std::size_t place = 0; place < _mounts.size(); ++place) _byId[_mounts[place].id] = place;
  findVisible();
  for (std::size_t place = 0; place < _mounts.size(); ++place) {
    const auto& mount = _mounts[place];
    if (!mount.visible) continue;
    auto& best = _byDevice.try_emplace(mount.device, place).first->second;
    if (_mounts[best].root != "/" && mount.root == "/") best = place;
  }
}

void MountTable::findVisible() {
  std::unordered_set<std::uint64_t> covered;
  for (const auto& mount : _mounts) {
    const auto parent = _byId.find(mount.parent);
    if (parent != _byId.end() && mount.parent != mount.id && _mounts[parent->second].point == mount.point)
      covered.insert(mount.parent);
  }
  std::vector<std::size_t> places(_mounts.size());
  std::iota(places.begin(), places.end(), std::size_t{0});
  // Whether a mount is seen depends on those above it only.
  std::ranges::stable_sort(places, [this](std::size_t left, std::size_t right) {
    return _mounts[left].point.size() < _mounts[right].point.size();
  });
  for (const auto place : places) {
    auto& mount = _mounts[place];
    mount.visible = !covered.contains(mount.id) && isReached(mount);
    if (mount.visible) _visibleAt[mount.point] = place;
  }
}

/// Whether the mount point lies in the mount that is seen there.
bool MountTable::isReached(const Mount& mount) const {
  if (mount.point == "/") return true;
  auto under = _byId.find(mount.parent);
  for (std::size_t step = 0; step < _mounts.size() && under != _byId.end(); ++step) {
    const auto& parent = _mounts[under->second];
    if (parent.point != mount.point) return &parent == visibleAbove(parentFolder(mount.point));
    under = _byId.find(parent.parent);
  }
  return under == _byId.end();
}

const Mount* MountTable::visibleAbove(const std::string& path) const {
  for (auto folder = path;; folder = parentFolder(folder)) {
    if (const auto found = _visibleAt.find(folder); found != _visibleAt.end()) return &_mounts[found->second];
    if (folder == "/") return nullptr;
  }
}

const Mount* MountTable::holding(const std::string& path) const {
  return path.starts_with('/') ? visibleAbove(path) : nullptr;
}

const Mount* MountTable::mountOf(DeviceNumber device) const {
  const auto found = _byDevice.find(device);
  return found == _byDevice.end() ? nullptr : &_mounts[found->second];
}

}  // namespace tavisk

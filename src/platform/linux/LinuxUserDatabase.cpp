// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxUserDatabase.h"

#include <grp.h>
#include <unistd.h>

#include <cerrno>

namespace tavisk {
namespace {

// Groups with many thousands of members exist; beyond this the answer is not believed.
constexpr std::size_t largestGroupEntry = std::size_t{64} << 20U;

}  // namespace

UserId LinuxUserDatabase::realUserId() {
  return ::getuid();
}

std::optional<std::vector<GroupId>> LinuxUserDatabase::supplementaryGroups(std::size_t room) {
  std::vector<GroupId> groups(room);
  int count = ::getgroups(static_cast<int>(room), groups.data());
  if (count < 0 || static_cast<std::size_t>(count) > room) return std::nullopt;
  groups.resize(static_cast<std::size_t>(count));
  return groups;
}

std::optional<GroupId> LinuxUserDatabase::groupNamed(const std::string& name) {
  group entry{};
  group* found = nullptr;
  std::vector<char> texts(4096);
  while (::getgrnam_r(name.c_str(), &entry, texts.data(), texts.size(), &found) == ERANGE) {
    if (texts.size() >= largestGroupEntry) return std::nullopt;
    texts.resize(texts.size() * 2);
  }
  if (found == nullptr) return std::nullopt;
  return found->gr_gid;
}

}  // namespace tavisk

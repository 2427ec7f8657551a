// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/NameOwners.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include "platform/Text.h"
#include "platform/linux/HostNameFiles.h"
#include "platform/linux/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr std::size_t fileLimit = std::size_t{1} << 20U;
constexpr const char* cloudConfig = "/etc/cloud/cloud.cfg";
constexpr const char* responderConfig = "/etc/avahi/avahi-daemon.conf";

/// As cloud-init reads them: a later file goes before an earlier one.
std::vector<std::string> cloudConfigFiles(const SystemRoot& root) {
  std::vector<std::string> files{cloudConfig};
  for (const auto& name : root.list("/etc/cloud/cloud.cfg.d").valueOr({}))
    if (name.ends_with(".cfg")) files.push_back("/etc/cloud/cloud.cfg.d/" + name);
  return files;
}

bool preservesHostName(const SystemRoot& root) {
  constexpr std::string_view words[] = {"true", "yes", "on"};
  bool preserves = false;
  for (const auto& file : cloudConfigFiles(root)) {
    for (const auto& line : split(root.read(file, fileLimit).valueOr(""), "\n")) {
      const auto setting = split(line, " \t\r");
      if (setting.size() > 1 && line.starts_with("preserve_hostname:"))
        preserves = std::ranges::find(words, lowerCased(setting[1])) != std::end(words);
    }
  }
  return preserves;
}

bool isOwnedByCloud(const SystemRoot& root) {
  return root.exists("/usr/bin/cloud-init") && root.exists(cloudConfig) &&
         !root.exists("/etc/cloud/cloud-init.disabled") && !preservesHostName(root);
}

}  // namespace

std::string whoUndoesHostName(const SystemRoot& root, const std::string& name) {
  std::string owners;
  if (isOwnedByCloud(root)) owners = "cloud-init (/etc/cloud has no \"preserve_hostname: true\")";
  const auto announced = assignments(root.read(responderConfig, fileLimit).valueOr(""), "server", "host-name");
  if (!announced.empty() && compareIgnoringCase(announced.back(), firstLabel(name)) != 0)
    owners += std::string(owners.empty() ? "" : ", ") + responderConfig + " (host-name=" + announced.back() + ")";
  return owners;
}

}  // namespace tavisk

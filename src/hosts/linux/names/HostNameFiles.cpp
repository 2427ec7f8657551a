// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/names/HostNameFiles.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <string_view>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/ShellAssignments.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr std::size_t hostsLimit = std::size_t{4} << 20U;
constexpr const char* prettyName = "PRETTY_HOSTNAME";
constexpr const char* kernelNameFile = "/proc/sys/kernel/hostname";
constexpr const char* kernelWithoutName = "(none)";
constexpr std::string_view ownAddress = "127.0.1.1";
constexpr const char* cloudConfig = "/etc/cloud/cloud.cfg";
constexpr const char* cloudConfigFolder = "/etc/cloud/cloud.cfg.d";
constexpr const char* responderConfig = "/etc/avahi/avahi-daemon.conf";

Result<std::string> readIfThere(const SystemRoot& root, const char* file, std::size_t limit = configurationLimit) {
  if (!root.exists(file)) return std::string();
  return root.read(file, limit);
}

/// The words of a line of hosts(5) that name this machine, renamed; each name stands once.
std::vector<std::string> namesAfter(const std::vector<std::string>& names, const std::string& before,
                                    const std::string& now) {
  const auto oldLabel = firstLabel(before);
  const auto newLabel = firstLabel(now);
  std::vector<std::string> result;
  const auto add = [&result](const std::string& name) {
    if (std::ranges::find(result, name) == result.end()) result.push_back(name);
  };
  for (const auto& name : names) {
    if (name != before && firstLabel(name) != oldLabel) {
      add(name);
    } else if (now != newLabel) {
      add(now);
      add(newLabel);
    } else {
      add(newLabel + name.substr(firstLabel(name).size()));
    }
  }
  if (!before.empty() && result != names) add(now);
  return result;
}

std::string lineWithName(const std::string& line, const std::string& before, const std::string& now) {
  const auto comment = std::min(line.find('#'), line.size());
  auto names = split(line.substr(0, comment), " \t\r");
  if (names.empty() || names.front() != ownAddress) return line;
  names.erase(names.begin());
  const auto changed = namesAfter(names, before, now);
  if (changed == names) return line;
  auto text = std::string(ownAddress);
  for (const auto& name : changed) text += (&name == &changed.front() ? "\t" : " ") + name;
  return text + (comment < line.size() ? " " + line.substr(comment) : "");
}

/// As cloud-init reads them: a later file goes before an earlier one.
std::vector<std::string> cloudConfigFiles(const SystemRoot& root) {
  std::vector<std::string> files{cloudConfig};
  for (const auto& name : root.list(cloudConfigFolder).valueOr({}))
    if (name.ends_with(".cfg")) files.push_back(std::string(cloudConfigFolder) + "/" + name);
  return files;
}

/// Only at the beginning of a line: an indented one belongs to another key.
std::optional<bool> hostNamePreservedIn(const std::string& text) {
  constexpr std::string_view yes[] = {"true", "yes", "on"};
  std::optional<bool> isPreserved;
  for (const auto& line : split(text, "\n")) {
    const auto words = split(line, " \t\r");
    if (words.size() > 1 && line.starts_with("preserve_hostname:"))
      isPreserved = std::ranges::find(yes, lowerCased(words[1])) != std::end(yes);
  }
  return isPreserved;
}

bool preservesHostName(const SystemRoot& root) {
  bool isPreserved = false;
  for (const auto& file : cloudConfigFiles(root))
    isPreserved = hostNamePreservedIn(root.read(file, configurationLimit).valueOr("")).value_or(isPreserved);
  return isPreserved;
}

bool isOwnedByCloud(const SystemRoot& root) {
  return root.exists("/usr/bin/cloud-init") && root.exists(cloudConfig) &&
         !root.exists("/etc/cloud/cloud-init.disabled") && !preservesHostName(root);
}

}  // namespace

Result<std::optional<std::string>> prettyHostName(const SystemRoot& root) {
  const auto text = readIfThere(root, prettyNameFile);
  if (!text) return text.failure();
  auto name = assignedValue(*text, prettyName);
  return name && name->empty() ? std::nullopt : name;
}

Result<void> setPrettyHostName(const SystemRoot& root, const std::string& name) {
  const auto text = readIfThere(root, prettyNameFile);
  if (!text) return text.failure();
  return root.write(prettyNameFile, withAssignment(*text, prettyName, name));
}

Result<std::optional<std::string>> staticHostName(const SystemRoot& root) {
  const auto text = readIfThere(root, staticNameFile);
  if (!text) return text.failure();
  const auto lines = configurationLines(*text);
  return lines.empty() ? std::nullopt : std::optional(split(lines.front(), " \t\r").front());
}

Result<void> setStaticHostName(const SystemRoot& root, const std::string& name) {
  return root.write(staticNameFile, name + "\n");
}

Result<std::optional<std::string>> kernelHostName(const SystemRoot& root) {
  const auto text = root.read(kernelNameFile, configurationLimit);
  if (!text) return text.failure();
  const auto lines = split(*text, "\n");
  if (lines.empty() || lines.front() == kernelWithoutName) return std::optional<std::string>();
  return std::optional(lines.front());
}

Result<void> setKernelHostName(const SystemRoot& root, const std::string& name) {
  // The file is read-only in containers that may set the name all the same.
  if (root.prefix() == "/") {
    if (::sethostname(name.data(), name.size()) != 0) return systemFailure("sethostname", name, errno);
    return {};
  }
  const auto file = root.open(kernelNameFile, O_WRONLY | O_TRUNC);
  return file ? writeAll(*file, name + "\n", kernelNameFile) : file.failure();
}

Result<std::string> hostsOf(const SystemRoot& root) {
  return readIfThere(root, hostsFile, hostsLimit);
}

std::string hostsWithName(std::string_view hosts, const std::string& before, const std::string& now) {
  std::string text;
  while (!hosts.empty()) {
    const auto end = std::min(hosts.find('\n'), hosts.size());
    text += lineWithName(std::string(hosts.substr(0, end)), before, now);
    if (end < hosts.size()) text += '\n';
    hosts.remove_prefix(std::min(end + 1, hosts.size()));
  }
  return text;
}

std::string whoUndoesHostName(const SystemRoot& root, const std::string& name) {
  std::string owners;
  if (isOwnedByCloud(root)) owners = "cloud-init (/etc/cloud has no \"preserve_hostname: true\")";
  const auto announced = assignments(root.read(responderConfig, configurationLimit).valueOr(""), "server", "host-name");
  if (!announced.empty() && compareIgnoringCase(announced.back(), firstLabel(name)) != 0)
    owners += std::string(owners.empty() ? "" : ", ") + responderConfig + " (host-name=" + announced.back() + ")";
  return owners;
}

}  // namespace tavisk

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
constexpr const char* ownAddress = "127.0.1.1";
constexpr const char* everyMachine = "localhost";
constexpr const char* lookupConfig = "/etc/nsswitch.conf";
constexpr const char* cloudConfig = "/etc/cloud/cloud.cfg";
constexpr const char* cloudConfigFolder = "/etc/cloud/cloud.cfg.d";
constexpr const char* responderConfig = "/etc/avahi/avahi-daemon.conf";

Result<std::string> readIfThere(const SystemRoot& root, const std::string& file,
                                std::size_t limit = configurationLimit) {
  return orEmpty(root.read(file, limit));
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
  const auto isOther = [&](const std::string& name) { return name != before && firstLabel(name) != oldLabel; };
  if (std::ranges::all_of(names, isOther)) return names;
  for (const auto& name : names) {
    if (isOther(name)) {
      add(name);
    } else if (now != newLabel) {
      add(now);
      add(newLabel);
    } else {
      add(newLabel + name.substr(firstLabel(name).size()));
    }
  }
  if (result != names) add(now);
  return result;
}

/// A line of hosts(5): an address, its names, and the comment behind them.
struct HostsLine {
  explicit HostsLine(const std::string& line) {
    const auto end = std::min(line.find('#'), line.size());
    names = split(line.substr(0, end), " \t\r");
    if (!names.empty()) {
      address = names.front();
      names.erase(names.begin());
    }
    comment = line.substr(end);
  }
  bool isOf(const std::vector<std::string>& addresses) const {
    return !names.empty() && std::ranges::find(addresses, address) != addresses.end();
  }
  std::string text() const {
    auto text = address;
    for (const auto& name : names) text += (&name == &names.front() ? "\t" : " ") + name;
    return text + (comment.empty() ? "" : " " + comment);
  }

  std::string address;
  std::vector<std::string> names;
  std::string comment;
};

/// The line with other names, where it is one of these addresses.
template <typename Rename>
std::string renamed(const std::string& line, const std::vector<std::string>& addresses, Rename rename) {
  HostsLine parts(line);
  if (!parts.isOf(addresses)) return line;
  const auto before = parts.names;
  parts.names = rename(before);
  return parts.names == before ? line : parts.text();
}

bool nameIt(const std::vector<std::string>& names, const std::string& machine) {
  const bool isWhole = machine != firstLabel(machine);
  return std::ranges::any_of(names, [&](const auto& name) { return (isWhole ? name : firstLabel(name)) == machine; });
}

/// The names of a line that has none which is known: the machine's own in front of them. They may be somebody's
/// aliases. Each name stands once.
std::vector<std::string> namesWithOwn(const std::vector<std::string>& names, const std::string& now) {
  std::vector<std::string> all{now};
  if (now != firstLabel(now)) all.push_back(firstLabel(now));
  for (const auto& name : names)
    if (std::ranges::find(all, name) == all.end()) all.push_back(name);
  return all;
}

template <typename Change>
std::string changedLines(std::string_view text, Change change) {
  std::string changed;
  while (!text.empty()) {
    const auto end = std::min(text.find('\n'), text.size());
    changed += change(std::string(text.substr(0, end)));
    if (end < text.size()) changed += '\n';
    text.remove_prefix(std::min(end + 1, text.size()));
  }
  return changed;
}

std::vector<HostsLine> hostsLines(std::string_view text) {
  std::vector<HostsLine> lines;
  for (const auto& line : split(text, "\n")) lines.emplace_back(line);
  return lines;
}

bool hasName(std::string_view hosts, const std::string& name) {
  return std::ranges::any_of(hostsLines(hosts), [&](const HostsLine& line) {
    return std::ranges::find(line.names, name) != line.names.end();
  });
}

/// Whether a module is asked that knows the machine's own name (nss-myhostname(8), nss-resolve(8)).
bool isAnsweredByItself(const std::string& lookups) {
  for (const auto& line : configurationLines(lookups)) {
    const auto words = split(line, " \t\r");
    if (words[0] != "hosts:") continue;
    return std::ranges::any_of(words, [](const auto& word) { return word == "myhostname" || word == "resolve"; });
  }
  return false;
}

/// As cloud-init reads them: a later file goes before an earlier one.
Result<std::vector<std::string>> cloudConfigFiles(const SystemRoot& root) {
  const auto names = orEmpty(root.list(cloudConfigFolder));
  if (!names) return names.failure();
  std::vector<std::string> files{cloudConfig};
  for (const auto& name : *names)
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

Result<bool> preservesHostName(const SystemRoot& root) {
  const auto files = cloudConfigFiles(root);
  if (!files) return files.failure();
  bool isPreserved = false;
  for (const auto& file : *files) {
    const auto text = readIfThere(root, file);
    if (!text) return text.failure();
    isPreserved = hostNamePreservedIn(*text).value_or(isPreserved);
  }
  return isPreserved;
}

/// As far as it is known for sure.
bool isOwnedByCloud(const SystemRoot& root) {
  const auto is = [](const Result<bool>& answer, bool wanted) { return answer && *answer == wanted; };
  return is(root.isThere("/usr/bin/cloud-init"), true) && is(root.isThere(cloudConfig), true) &&
         is(root.isThere("/etc/cloud/cloud-init.disabled"), false) && is(preservesHostName(root), false);
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
  const auto text = orEmpty(root.read(kernelNameFile, configurationLimit));
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

bool hostsName(std::string_view hosts, const std::string& name) {
  return hasName(hosts, name) || std::ranges::any_of(hostsLines(hosts), [&](const HostsLine& line) {
           return line.isOf({ownAddress}) && nameIt(line.names, name);
         });
}

bool hostsNameTheMachine(std::string_view hosts) {
  return std::ranges::any_of(hostsLines(hosts), [](const HostsLine& line) { return line.isOf({ownAddress}); });
}

std::vector<std::string> addressesNamed(std::string_view hosts, const std::vector<std::string>& names) {
  std::vector<std::string> addresses;
  for (const auto& line : hostsLines(hosts)) {
    const bool isNamed = std::ranges::any_of(
        names, [&](const std::string& name) { return !name.empty() && nameIt(line.names, firstLabel(name)); });
    if (isNamed && !line.isOf(addresses)) addresses.push_back(line.address);
  }
  return addresses;
}

std::string hostsWithName(std::string_view hosts, const std::vector<std::string>& before, const std::string& now,
                          const std::vector<std::string>& own) {
  std::string text(hosts);
  auto addresses = own;
  addresses.emplace_back(ownAddress);
  for (const auto& old : before) {
    if (old.empty() || firstLabel(old) == everyMachine) continue;
    text = changedLines(text, [&](const std::string& line) {
      return renamed(line, addresses, [&](const auto& names) { return namesAfter(names, old, now); });
    });
  }
  bool isDone = hostsName(text, now);
  return changedLines(text, [&](const std::string& line) {
    if (isDone || !HostsLine(line).isOf({ownAddress})) return line;
    isDone = true;
    return renamed(line, {ownAddress}, [&](const auto& names) { return namesWithOwn(names, now); });
  });
}

std::string whyNotResolved(const SystemRoot& root, const std::string& name) {
  const auto hosts = hostsOf(root);
  const auto config = readIfThere(root, lookupConfig);
  if (!hosts || !config || hasName(*hosts, name) || isAnsweredByItself(*config)) return {};
  return std::string("no line of ") + hostsFile + " has the name: unless a name server knows it, it does not resolve";
}

std::string whoUndoesHostName(const SystemRoot& root, const std::string& name) {
  std::string owners;
  if (isOwnedByCloud(root)) owners = "cloud-init (/etc/cloud has no \"preserve_hostname: true\")";
  const auto configured = root.read(responderConfig, configurationLimit);
  const auto announced = assignments(configured ? *configured : "", "server", "host-name");
  if (!announced.empty() && compareIgnoringCase(announced.back(), firstLabel(name)) != 0)
    owners += std::string(owners.empty() ? "" : ", ") + responderConfig + " (host-name=" + announced.back() + ")";
  return owners;
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ProcessScan.h"

#include <string_view>
#include <utility>

#include "base/Path.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t procFileLimit = std::size_t{1} << 20U;
constexpr std::size_t longestCommand = 15;  // the kernel cuts the name in /proc/PID/stat there

/// One process's folder in /proc.
class Process {
 public:
  Process(const SystemRoot& root, std::string id) : _root(root), _folder("/proc/" + std::move(id)) {}

  bool isNamed(const std::string& name) const {
    const auto stat = _root.read(_folder + "/stat", procFileLimit);
    if (!stat) return false;
    const auto open = stat->find('(');
    const auto close = stat->rfind(')');
    if (open == std::string::npos || close == std::string::npos || close + 2 >= stat->size()) return false;
    const char state = (*stat)[close + 2];
    if (state == 'Z' || state == 'X') return false;
    if (stat->substr(open + 1, close - open - 1) != name.substr(0, longestCommand)) return false;
    return runsProgram(name);
  }

  std::string processNamespace() const { return _root.readLink(_folder + "/ns/pid").valueOr(""); }

 private:
  /// False for a kernel thread, which has no command line.
  bool runsProgram(const std::string& name) const {
    const auto commandLine = _root.read(_folder + "/cmdline", procFileLimit).valueOr("");
    if (commandLine.empty() || name.size() <= longestCommand) return !commandLine.empty();
    if (const auto program = _root.readLink(_folder + "/exe")) return baseName(withoutMark(*program)) == name;
    return baseName(commandLine.substr(0, commandLine.find('\0'))) == name;
  }

  static std::string withoutMark(const std::string& program) {
    constexpr std::string_view mark = " (deleted)";
    return program.ends_with(mark) ? program.substr(0, program.size() - mark.size()) : program;
  }

  const SystemRoot& _root;
  std::string _folder;
};

}  // namespace

std::vector<ProcessId> processesNamed(const SystemRoot& root, const std::string& name) {
  const auto self = root.readLink("/proc/self").valueOr("");
  const auto here = Process(root, "self").processNamespace();
  std::vector<ProcessId> found;
  for (const auto& entry : root.list("/proc").valueOr({})) {
    const auto id = parseNumber<ProcessId>(entry);
    if (!id || entry == self) continue;
    const Process process(root, entry);
    // Another user's process hides its namespace from those who are not root.
    const auto there = process.processNamespace();
    if ((there.empty() || there == here) && process.isNamed(name)) found.push_back(*id);
  }
  return found;
}

}  // namespace tavisk

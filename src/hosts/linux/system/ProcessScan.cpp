// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ProcessScan.h"

#include <optional>
#include <string_view>
#include <utility>

#include "base/Path.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t longestProgram = 4096;  // PATH_MAX
constexpr std::size_t procFileLimit = std::size_t{1} << 20U;
constexpr std::size_t longestCommand = 15;  // the kernel cuts the name in /proc/PID/stat there

/// What /proc keeps to itself: the process has ended, is another user's, or is one of the kernel's and has no such
/// file.
template <typename Value>
Result<std::optional<Value>> orHidden(Result<Value> found) {
  if (found) return std::optional(std::move(found).value());
  const auto& code = found.failure().code;
  if (isAbsent(found.failure()) || code == std::errc::no_such_process || code == std::errc::permission_denied ||
      code == std::errc::operation_not_permitted)
    return std::optional<Value>();
  return found.failure();
}

/// One process's folder in /proc.
class Process {
 public:
  Process(const SystemRoot& root, const std::string& id) : _root(root), _folder("/proc/" + id) {}

  Result<bool> isNamed(const std::string& name) const {
    const auto found = orHidden(_root.read(_folder + "/stat", procFileLimit));
    if (!found) return found.failure();
    const auto stat = found->value_or("");
    const auto open = stat.find('(');
    const auto close = stat.rfind(')');
    if (open == std::string::npos || close == std::string::npos || close + 2 >= stat.size()) return false;
    const char state = stat[close + 2];
    if (state == 'Z' || state == 'X') return false;
    if (stat.substr(open + 1, close - open - 1) != name.substr(0, longestCommand)) return false;
    return runsProgram(name);
  }

  /// Another user's process hides its namespace from those who are not root: it is then taken for one of this machine.
  Result<bool> isOf(const std::string& processNamespace) const {
    const auto there = orHidden(_root.readLink(_folder + "/ns/pid"));
    if (!there) return there.failure();
    return !*there || **there == processNamespace;
  }

 private:
  /// False for a kernel thread, which has no command line.
  Result<bool> runsProgram(const std::string& name) const {
    const auto found = orHidden(_root.readBeginning(_folder + "/cmdline", longestProgram));
    if (!found) return found.failure();
    const auto commandLine = found->value_or("");
    if (commandLine.empty() || name.size() <= longestCommand) return !commandLine.empty();
    const auto program = orHidden(_root.readLink(_folder + "/exe"));
    if (!program) return program.failure();
    return baseName(*program ? withoutMark(**program) : commandLine.substr(0, commandLine.find('\0'))) == name;
  }

  static std::string withoutMark(const std::string& program) {
    constexpr std::string_view mark = " (deleted)";
    return program.ends_with(mark) ? program.substr(0, program.size() - mark.size()) : program;
  }

  const SystemRoot& _root;
  std::string _folder;
};

}  // namespace

Result<std::vector<ProcessId>> processesNamed(const SystemRoot& root, const std::string& name) {
  const auto self = orEmpty(root.readLink("/proc/self"));
  if (!self) return self.failure();
  const auto here = orEmpty(root.readLink("/proc/self/ns/pid"));
  if (!here) return here.failure();
  const auto entries = orEmpty(root.list("/proc"));
  if (!entries) return entries.failure();
  std::vector<ProcessId> found;
  for (const auto& entry : *entries) {
    const auto id = parseNumber<ProcessId>(entry);
    if (!id || entry == *self) continue;
    const Process process(root, entry);
    const auto isHere = process.isOf(*here);
    if (!isHere) return isHere.failure();
    const auto isNamed = *isHere ? process.isNamed(name) : isHere;
    if (!isNamed) return isNamed.failure();
    if (*isNamed) found.push_back(*id);
  }
  return found;
}

}  // namespace tavisk

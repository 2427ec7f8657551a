// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/DnsName.h"
#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

inline constexpr const char* prettyNameFile = "/etc/machine-info";
inline constexpr const char* staticNameFile = "/etc/hostname";
inline constexpr const char* hostsFile = "/etc/hosts";

/// The name for people in machine-info(5), and the host name in hostname(5). Absent when there is none; a file that
/// cannot be read is a failure.
Result<std::optional<std::string>> prettyHostName(const SystemRoot& root);
Result<std::optional<std::string>> staticHostName(const SystemRoot& root);
/// An empty pretty name takes it out of the file.
Result<void> setPrettyHostName(const SystemRoot& root, const std::string& name);
Result<void> setStaticHostName(const SystemRoot& root, const std::string& name);

/// What the kernel calls the machine (gethostname(2)), at most 64 bytes; absent when it was never given a name.
Result<std::optional<std::string>> kernelHostName(const SystemRoot& root);
inline constexpr std::size_t longestKernelHostName = 64;
Result<void> setKernelHostName(const SystemRoot& root, const std::string& name);

/// The text of hosts(5); empty where there is no such file.
Result<std::string> hostsOf(const SystemRoot& root);
/// Whether a line has this name; on a line of 127.0.1.1 one of a single label may stand before a dot.
bool hostsName(std::string_view hosts, const std::string& name);
/// Whether there is a line of the address 127.0.1.1, by which a machine calls itself that has no other.
bool hostsNameTheMachine(std::string_view hosts);
/// The addresses of the lines that have one of these names, once each.
std::vector<std::string> addressesNamed(std::string_view hosts, const std::vector<std::string>& names);
/// The text of hosts(5) with the machine's own name, on the lines of 127.0.1.1 and of the addresses `own`, changed to
/// `now`; what follows its first label there stays, and so do all other names, "localhost" too. The lines have one of
/// the names `before`; where none has `now` then, a line of 127.0.1.1 with one that nobody knows any more gets it.
std::string hostsWithName(std::string_view hosts, const std::vector<std::string>& before, const std::string& now,
                          const std::vector<std::string>& own);

/// Why the machine's own name may lead to no address, for people: no line of hosts(5) has it, and nsswitch.conf(5) asks
/// nobody who answers for it. Empty where it does, or where that cannot be looked at.
std::string whyNotResolved(const SystemRoot& root, const std::string& name);

/// What on this machine sets another host name when it starts the next time, for people; empty when nothing is known,
/// also of what cannot be looked at.
std::string whoUndoesHostName(const SystemRoot& root, const std::string& name);

}  // namespace tavisk

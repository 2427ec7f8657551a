// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "startupdisk/SDEnvironment.h"

/// What the machine's firmware and device tree say.
namespace tavisk {

/// The value of a firmware variable, as the program /usr/sbin/nvram prints it. Absent when the program cannot be run
/// or fails, when it prints no value of at least two characters, and on a machine with pre-boot environment 1.
std::optional<std::string> runNVRAMTool(SDEnvironment& environment, const std::string& argument);

/// Whether the device tree says that the machine is a "HalbRISC". True also when the device tree cannot be read.
bool machineHasHalbRISCCompatible(SDEnvironment& environment);

std::string machineModelString(SDEnvironment& environment);

/// The device-tree path of the device that carries the network interface; absent when there is none.
std::optional<std::string> getOFPathForBSDName(SDEnvironment& environment, const std::string& bsdName);

/// The BSD name of the network interface whose device has this device-tree path; absent when there is none. Only
/// interfaces that are up, not the loopback and have an IPv4 address are known: the machine is asked for them at the
/// first call, also without a path.
std::optional<std::string> interfaceForOFPath(SDEnvironment& environment, const std::optional<std::string>& path);

}  // namespace tavisk

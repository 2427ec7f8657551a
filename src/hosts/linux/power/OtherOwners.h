// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <initializer_list>
#include <string>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Programs that set power settings too, by their own rules.
enum class OtherOwner { tlp, laptopMode, powertop, smartd, hdIdle, networkManager };

/// Those of them that are at work on this machine, by name: "TLP, smartd"; empty: none.
std::string ownersAtWork(const SystemRoot& root, std::initializer_list<OtherOwner> owners);

}  // namespace tavisk

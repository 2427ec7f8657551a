// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/PropertyList.h"
#include "hosts/shared/PropertyListFile.h"
#include "hosts/shared/SettingChange.h"
#include "platform/BootLoaderFile.h"

namespace tavisk {

/// The architecture in the file, as the setting by which a host tells the effects; "default" when the key is absent.
/// What is given must outlive the setting. The first is of a file that was `read`; a change of the second writes
/// the architecture of `contents` into the file as it is then, and what else they have where the file lacks it.
Setting<std::string> kernelArchitecture(const Result<std::optional<PropertyList::Dictionary>>& read);
Setting<std::string> kernelArchitecture(const PropertyListFile& file, const PropertyList::Dictionary& contents);
/// The same to be reset; its own part needs nobody's leave.
Setting<std::string> kernelArchitecture(const PropertyListFile& file);
/// The value that a change of kernelArchitecture to these contents asks for.
std::string architectureIn(const PropertyList::Dictionary& contents);

}  // namespace tavisk

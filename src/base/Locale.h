// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

namespace tavisk {

/// The canonical locale identifier of a language name or tag: "English" and "EN" are "en", "pt-br" is "pt_BR",
/// "zh-hant-tw" is "zh-Hant_TW" (subtags as RFC 5646 has them). Case and separators are made regular; a name that is
/// neither comes back as it is.
std::string canonicalLocaleIdentifier(std::string_view language);

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchBootLoaderFile.h"

namespace tavisk {

std::optional<PropertyList::Dictionary> ScratchBootLoaderFile::read() {
  if (!_settings.observe(kernelArchitecture(_file, {}))) return std::nullopt;
  return _file.read().valueOr(std::nullopt);
}

bool ScratchBootLoaderFile::write(const PropertyList::Dictionary& contents) {
  const auto effect = _settings.carryOut(kernelArchitecture(_file, contents), architectureIn(contents));
  return effect.outcome != Outcome::failed;
}

}  // namespace tavisk

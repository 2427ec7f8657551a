// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchBootLoaderFile.h"

#include "hosts/shared/KernelArchitecture.h"

namespace tavisk {

std::optional<PropertyList::Dictionary> ScratchBootLoaderFile::read() {
  const auto contents = _file.read();
  if (!_settings.observe(kernelArchitecture(contents))) return std::nullopt;
  return contents.valueOr(std::nullopt);
}

bool ScratchBootLoaderFile::write(const PropertyList::Dictionary& contents) {
  auto setting = kernelArchitecture(_file, contents);
  setting.store = [this, write = setting.store](const std::string& architecture) -> Result<void> {
    const auto held = _machine.lock();
    return held ? write(architecture) : held.failure();
  };
  const auto effect = _settings.carryOut(setting, architectureIn(contents));
  return effect.outcome != Outcome::failed;
}

}  // namespace tavisk

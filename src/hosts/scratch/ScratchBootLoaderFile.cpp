// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchBootLoaderFile.h"

#include "hosts/shared/KernelArchitecture.h"

namespace tavisk {

Result<std::optional<PropertyList::Dictionary>> ScratchBootLoaderFile::read() {
  auto contents = _file.read();
  const bool isTold = _settings.observe(kernelArchitecture(contents)).has_value();
  if (contents && !isTold) return Failure{"read", path, "the machine refuses it"};
  return contents;
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

void ScratchBootLoaderFile::reset() {
  auto setting = kernelArchitecture(_file);
  setting.own.takeAway = [this, takeAway = setting.own.takeAway](WrittenPlaces& taken) -> Result<void> {
    const auto held = _machine.lock();
    return held ? takeAway(taken) : held.failure();
  };
  _settings.reset(setting);
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/machine/LinuxBootLoaderFile.h"

#include "hosts/linux/system/Rights.h"
#include "hosts/shared/KernelArchitecture.h"

namespace tavisk {

Result<std::optional<PropertyList::Dictionary>> LinuxBootLoaderFile::read() {
  auto contents = _file.read();
  static_cast<void>(observe(kernelArchitecture(contents), _machine.effects));
  return contents;
}

bool LinuxBootLoaderFile::write(const PropertyList::Dictionary& contents) {
  auto setting = kernelArchitecture(_file, contents);
  setting.note = saying("stored; no boot loader here reads it");
  setting.check = [](const std::string&) { return check(); };
  const auto effect = carryOut(setting, architectureIn(contents), _machine);
  return effect.outcome != Outcome::failed;
}

void LinuxBootLoaderFile::reset() {
  auto setting = kernelArchitecture(_file);
  setting.own.check = check;
  tavisk::reset(setting, _machine);
}

Result<void> LinuxBootLoaderFile::check() {
  const auto failure = whyNeedsRoot("write", path);
  return failure ? Result<void>(*failure) : Result<void>();
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/SystemFiles.h"

namespace tavisk {

bool SystemFiles::exists(const std::string& path) {
  return _real.exists(path) || contents(path);
}

Result<std::string> SystemFiles::read(const std::string& path, std::size_t limit) {
  auto found = _real.read(path, limit);
  if (found || !isAbsent(found.failure())) return found;
  const auto shown = contents(path);
  return shown && shown->size() <= limit ? Result<std::string>(*shown) : found;
}

Result<std::string> SystemFiles::readBeginning(const std::string& path, std::size_t length) {
  auto found = _real.readBeginning(path, length);
  if (found || !isAbsent(found.failure())) return found;
  const auto shown = contents(path);
  return shown ? Result<std::string>(shown->substr(0, length)) : found;
}

/// What is shown is where it is shown, also where the machine has a link of the same name.
Result<std::string> SystemFiles::standardized(const std::string& path) {
  return _systems.shown()->isShown(path) && !_real.exists(path) ? Result<std::string>(path) : _real.standardized(path);
}

}  // namespace tavisk

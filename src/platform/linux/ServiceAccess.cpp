// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/ServiceAccess.h"

#include "platform/linux/InitScriptDaemons.h"

namespace tavisk {

Daemons& ServiceAccess::daemons() {
  if (!_daemons) _daemons = std::make_unique<InitScriptDaemons>(_root, _runLoop);
  return *_daemons;
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The one lock of a machine: a run holds it while it changes a setting, so that no two runs change something at once.
/// Nobody else can hold it up: its folder is open to root and the members of the group that may use the tool.
class MachineLock {
 public:
  /// Both must outlive the lock.
  MachineLock(const SystemRoot& root, RunLoop& runLoop) : _root(root), _runLoop(runLoop) {}

  /// The lock, until the descriptor is closed; a program that is started meanwhile does not keep it. Waits for another
  /// run as long as the command may take; the failure then names the process that holds the lock. Not to be asked for
  /// by who holds it.
  Result<FileDescriptor> hold() const;

 private:
  Result<FileDescriptor> openFile() const;
  Result<void> makeFolder() const;
  Failure whoHolds(const FileDescriptor& file) const;

  const SystemRoot& _root;
  RunLoop& _runLoop;
};

}  // namespace tavisk

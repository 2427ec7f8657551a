// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"
#include "platform/DiskDescription.h"

namespace tavisk {

enum class DiskTrait { internal, cd, dvd, optical };
/// The connection protocols that have a meaning to the callers.
enum class DiskProtocol { usb, diskImage };

/// What preBootEnvironment() answers.
namespace preboot {
inline constexpr int noneKnown = 0;
inline constexpr int openFirmware = 1;
inline constexpr int loadsBootEfi = 2;  ///< a firmware that loads "boot.efi"
}  // namespace preboot

/// What partitionScheme() answers; other codes are the host's.
namespace partitionmap {
inline constexpr int noneKnown = 0;
inline constexpr int openFirmware = 1;  ///< the map that Open Firmware starts from
inline constexpr int gpt = 2;
}  // namespace partitionmap

/// A status as the contract of these services has it: 0 is success.
using ServiceStatus = int;

/// Questions about one disk. From any thread; an unknown disk has no trait, no protocol and no scheme.
class DiskQueries {
 public:
  virtual ~DiskQueries() = default;

  struct OpticalBootability {
    ServiceStatus status = 0;
    bool bootable = false;  ///< means something only with status 0
  };

  virtual bool is(DiskTrait trait, const DiskName& disk) = 0;
  /// The disk's connection protocol; empty when there is none.
  virtual std::string protocolOf(const DiskName& disk) = 0;
  /// The host's name for a protocol, as protocolOf answers it.
  virtual std::string nameOf(DiskProtocol protocol) = 0;
  /// The code of the partition map, one of `partitionmap` or the host's.
  virtual int partitionScheme(const DiskName& disk) = 0;
  /// Whether the optical disc can start this machine.
  virtual OpticalBootability opticalBootability(const DiskName& disk) = 0;
};

/// What the machine starts from, and the firmware's variables. A write that fails has a non-zero status, and its
/// reason is in the effects; so has a read. Nothing is written then.
class BootSettings {
 public:
  virtual ~BootSettings() = default;

  struct LegacyBootSupport {
    ServiceStatus status = 0;
    bool supported = false;
  };
  struct BootPreference {
    ServiceStatus status = 0;
    std::optional<DiskName> disk;
  };
  struct NetworkBootPreference {
    ServiceStatus status = 0;
    std::optional<std::string> value;
    std::optional<std::string> server;
    std::optional<std::string> interface;  ///< BSD name
  };
  struct BootChoice {
    DiskName disk;
    std::string systemFolder;  ///< absolute path
    bool lumara9 = false;

    bool operator==(const BootChoice&) const = default;
  };

  /// One of `preboot`; what cannot be looked at is none known, and is told to the effects. From any thread.
  virtual int preBootEnvironment() = 0;
  virtual LegacyBootSupport legacyBootSupport() = 0;
  virtual BootPreference bootPreference() = 0;
  virtual NetworkBootPreference networkBootPreference() = 0;
  virtual ServiceStatus setBootPreference(const BootChoice& choice) = 0;
  /// A value that could not be found out is not written, and its failure is the reason.
  virtual ServiceStatus setFirmwareVariable(const std::string& name, const Result<std::string>& value) = 0;
};

class DiskManagementService : public DiskQueries, public BootSettings {};

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "hosts/linux/disks/LinuxDiskEventSession.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/linux/firmware/BootEntries.h"
#include "hosts/linux/firmware/EfiVariables.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/systems/LoaderLook.h"
#include "hosts/linux/systems/ShownSystems.h"

namespace tavisk {

/// The Linux systems that this machine's loaders are proven to start. While disks are watched they are looked for, and
/// the disks are told where their volumes are shown. From one thread, but for shown().
class LinuxSystems final : public DiskWatcher {
 public:
  using Explain = std::function<void(const std::string& message)>;

  /// `explain` is told why something is not shown. Nothing that is given is owned.
  LinuxSystems(const LinuxMachine& machine, LinuxDisks& disks, Explain explain);

  /// How long the first report of the disks waits for what is found: cold disks take some seeks. What is not done by
  /// then is told as a failed look; it is shown when it is done.
  static constexpr std::chrono::milliseconds longestBefore{1000};

  void begin(RunLoop& runLoop, std::function<void()> changed) override;
  void lookAgain() override;
  void end() override;

  /// As they were found last. From any thread.
  std::shared_ptr<const ShownSystems> shown() const;

  /// The machine of this moment, for a look of one's own.
  Result<LoaderSurroundings> surroundings() const;
  /// Fails also while several looks hang on a volume that does not answer: each holds a thread.
  Result<LoaderLook> beginLook(const LoaderSurroundings& machine) const;

 private:
  std::optional<LoaderPlace> currentPlace(const LoaderSurroundings& machine) const;
  /// After so many looks that a volume does not answer there is no other until one has ended.
  static constexpr std::size_t mostHanging = 4;

  void startLook();
  void hearOfMore();
  void take(const LoaderSight& sight);
  void keepShown(std::vector<ShownSystem>& systems) const;
  void letGo();
  void tellUnfinished();
  void tellReasons(const LoaderSight& sight, const std::vector<FoundLoader>& proven);
  template <typename Value>
  void tellReason(const std::string& what, const Result<Value>& found);
  void explain(const std::string& message) const;
  NamedPoints pointsOf(const MountTable& mounts) const;
  bool hasSystemOfItsOwn(const DiskName& volume, const MountTable& mounts);
  std::string bootFile() const;
  void show(std::vector<ShownSystem> systems);

  LinuxMachine _machine;
  LinuxDisks& _disks;
  EfiVariables _variables;
  BootEntries _entries;
  Explain _explain;
  RunLoop* _runLoop = nullptr;
  std::function<void()> _changed;
  std::optional<LoaderLook> _look;
  LoaderSurroundings _surroundings;        ///< of that look
  mutable std::vector<LoaderLook> _begun;  ///< those that had not ended lately
  mutable std::set<std::string> _explained;
  RunLoop::Registration _news;
  mutable std::mutex _mutex;  ///< of what is shown
  std::shared_ptr<const ShownSystems> _shown;
};

}  // namespace tavisk

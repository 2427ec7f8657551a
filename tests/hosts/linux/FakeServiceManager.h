// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <filesystem>
#include <map>
#include <mutex>
#include <string>
#include <vector>

#include "hosts/linux/BusPeer.h"

namespace tavisk {

/// A unit as the manager knows it, and what its next job comes to.
struct FakeUnit {
  std::string load = "loaded";
  std::string active = "inactive";
  std::string file = "disabled";
  std::string jobResult = "done";        ///< empty: the job never ends
  bool conditionHolds = true;            ///< else a job is done and the unit stays as it is
  std::string job = "";                  ///< the kind of the one that it has
  std::chrono::milliseconds delay = {};  ///< of each answer about its state
};

/// Serves the interface of the service manager from a thread of its own.
class FakeServiceManager {
 public:
  /// At a socket of its own, straight to each caller; or over the message bus whose socket it is, also as the
  /// systemd-timesyncd that has read time.example and uses fallback.example.
  enum class Reached { straight, overBus };
  explicit FakeServiceManager(const std::filesystem::path& socket, Reached reached = Reached::straight);

  /// The link by which a unit starts with the machine.
  static std::string linkOf(const std::string& unit) { return "/etc/systemd/system/default.target.wants/" + unit; }

  void set(const std::string& unit, const FakeUnit& state);
  FakeUnit get(const std::string& unit);
  /// The methods that change something, in the order of their calls: "StartUnit chrony.service".
  std::vector<std::string> calls();
  /// The next call of this method is answered with an error, with a reply of another type, by hanging up, never, or
  /// granted only after a question.
  enum class Fault { error, wrongType, hangUp, silence, question };
  void breakNext(const std::string& method, Fault fault);

 private:
  int receive(sd_bus_message* message, const std::string& member);
  int answer(sd_bus_message* message, const std::string& member);
  int answerFault(sd_bus_message* message, Fault fault);
  int answerUnits(sd_bus_message* message, bool loads);
  int answerProperty(sd_bus_message* message);
  int answerAllProperties(sd_bus_message* message);
  FakeUnit unitOf(sd_bus_message* message);
  int answerJob(sd_bus_message* message, const std::string& member);
  int answerFiles(sd_bus_message* message, const std::string& member);

  std::mutex _mutex;
  std::map<std::string, FakeUnit> _units;
  std::map<std::string, Fault> _faults;
  std::vector<std::string> _calls;
  unsigned _jobs = 0;
  BusPeer _peer;  ///< the last: its thread works with the others
};

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "TemporaryFolder.h"
#include "base/RunLoop.h"
#include "effects/EffectLog.h"
#include "effects/EffectSink.h"
#include "hosts/scratch/ScratchHost.h"

namespace tavisk {

/// A machine described by a temporary folder: it is put into any state, a host is opened on it, and what came of it is
/// read back. State set before host() is what the host opens with; later changes are another run's.
class ScratchMachine {
 public:
  ScratchMachine() { effects.addChannel(log); }

  std::string directory() const { return _folder.path(); }

  /// The whole machine.plist.
  void describe(std::string_view xml) { _folder.write("machine.plist", xml); }
  PropertyList::Dictionary description() const {
    auto file = _folder.path() / "machine.plist";
    if (!std::filesystem::exists(file)) return {};
    return *parsePropertyList(contentsOf(file), ownFileLimits)->asDictionary();
  }
  void set(std::string_view section, std::string_view key, PropertyList value) {
    auto machine = description();
    machine.dictionary(section).set(key, std::move(value));
    describe(*writePropertyList(std::move(machine)));
  }
  std::optional<PropertyList> get(std::string_view section, std::string_view key) const {
    auto machine = description();
    const auto* value = machine.dictionary(section).find(key);
    return value ? std::optional(*value) : std::nullopt;
  }
  void refuse(std::string_view setting, std::string_view reason) { set("Refusals", setting, std::string(reason)); }

  /// A file of the machine, by its path there.
  std::filesystem::path writeFile(const std::string& path, std::string_view contents) {
    return _folder.write("root" + path, contents);
  }
  std::string file(const std::string& path) const { return contentsOf(_folder.path() / ("root" + path)); }

  std::vector<std::string> systemLog() const { return linesOf(_folder.path() / "system.log"); }
  /// Opened at the first call, which throws std::runtime_error when the machine is refused.
  ScratchHost& host() {
    if (!_host) {
      auto opened = ScratchHost::open(directory(), effects, runLoop);
      if (!opened) throw std::runtime_error(opened.failure().on + ": " + opened.failure().why);
      _host = std::move(opened).value();
    }
    return *_host;
  }

  EffectSink effects;
  RunLoop runLoop;
  EffectLog log;

 private:
  TemporaryFolder _folder;
  std::unique_ptr<ScratchHost> _host;
};

}  // namespace tavisk

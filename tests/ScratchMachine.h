// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "platform/EffectSink.h"
#include "platform/RunLoop.h"
#include "platform/scratch/ScratchHost.h"

namespace tavisk {

inline std::string contentsOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

inline std::vector<std::string> linesOf(const std::filesystem::path& path) {
  std::ifstream file(path, std::ios::binary);
  std::vector<std::string> lines;
  for (std::string line; std::getline(file, line);) lines.push_back(line);
  return lines;
}

/// A folder of its own that goes with it.
class TemporaryFolder {
 public:
  TemporaryFolder() {
    std::string name = std::filesystem::temp_directory_path() / "tavisk-test-XXXXXX";
    if (!::mkdtemp(name.data())) throw std::runtime_error("mkdtemp");
    _path = name;
  }
  ~TemporaryFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(_path, ignored);
  }
  TemporaryFolder(const TemporaryFolder&) = delete;
  TemporaryFolder& operator=(const TemporaryFolder&) = delete;

  const std::filesystem::path& path() const { return _path; }
  /// `name` is relative, or absolute as on the machine whose root the folder is; the folders above are made.
  std::filesystem::path write(const std::string& name, std::string_view contents) const {
    auto path = _path / std::filesystem::path(name).relative_path();
    std::filesystem::create_directories(path.parent_path());
    std::ofstream(path, std::ios::binary) << contents;
    return path;
  }

 private:
  std::filesystem::path _path;
};

/// A machine described by a temporary folder: it is put into any state, a host is opened on it, and what came of it is
/// read back. State set before host() is what the host opens with; later changes are another run's.
class ScratchMachine {
 public:
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
  /// One JSON object each.
  std::vector<std::string> effectsLog() const { return linesOf(_folder.path() / "effects.log"); }

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

 private:
  TemporaryFolder _folder;
  std::unique_ptr<ScratchHost> _host;
};

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "fuzz/Targets.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>

#include "base/FileDescriptor.h"
#include "base/Text.h"
#include "control/StatusReader.h"

namespace tavisk::fuzz {
namespace {

constexpr std::string_view between = "\n--\n";

}  // namespace

const Target* targetNamed(std::string_view name) {
  const auto* found = std::ranges::find(targets, name, &Target::name);
  return found == std::end(targets) ? nullptr : found;
}

std::vector<std::string_view> partsOf(std::string_view bytes) {
  std::vector<std::string_view> parts;
  for (auto end = bytes.find(between); end != std::string_view::npos; end = bytes.find(between)) {
    parts.push_back(bytes.substr(0, end));
    bytes.remove_prefix(end + between.size());
  }
  parts.push_back(bytes);
  return parts;
}

std::string partOf(std::string_view bytes, std::size_t index) {
  const auto parts = partsOf(bytes);
  return index < parts.size() ? std::string(parts[index]) : std::string();
}

bool isHarmless(std::string_view text) {
  while (!text.empty()) {
    const auto codePoint = takeCodePoint(text);
    if (!codePoint || isControl(*codePoint)) return false;
  }
  return true;
}

void holdTold(const Failure& failure) {
  hold(!failure.tried.empty() && !failure.why.empty(), "a failure says what was tried and why it failed");
  hold(isHarmless(describe(failure)), "a failure is harmless at a terminal");
}

void holdSettings(Host& host, EffectSink& effects, RunLoop& runLoop, bool alsoSearched) {
  std::vector<const control::ManagedSetting*> settings;
  for (const auto& setting : control::managedSettings())
    if (alsoSearched || !setting.isSearched) settings.push_back(&setting);
  control::StatusReader reader;
  effects.addChannel(reader);
  for (const auto& state : reader.read(settings, host, runLoop))
    for (const auto& failure : state.failures) holdTold(failure);
  effects.removeChannel(reader);
}

void Tree::put(const std::string& path, std::string_view contents) {
  const auto make = [&] { return FileDescriptor(::open(at(path).c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644)); };
  auto file = make();
  if (!file) {
    makeFolder(path.substr(0, path.rfind('/')));
    file = make();
  }
  if (!writeAll(file, contents, path)) throw std::runtime_error("a file could not be made: " + path);
  _files.push_back(at(path));
}

void Tree::putLink(const std::string& path, const std::string& target) const {
  makeFolder(path.substr(0, path.rfind('/')));
  std::filesystem::create_symlink(target, at(path));
}

void Tree::makeFolder(const std::string& path) const {
  std::filesystem::create_directories(at(path));
}

void Tree::renew(const std::vector<std::pair<std::string, std::string>>& files) {
  clear();
  for (const auto& [path, contents] : files) put(path, contents);
}

void Tree::clear() {
  for (const auto& file : _files) ::unlink(file.c_str());
  _files.clear();
}

}  // namespace tavisk::fuzz

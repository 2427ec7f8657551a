// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/KernelPanic.h"

#include <algorithm>

#include "base/Path.h"
#include "base/Text.h"
#include "hosts/linux/power/KernelParameter.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* ownPanicSeconds = "10";
/// Read last where no service manager does it (sysctl(8), --system).
constexpr const char* mainPanicFile = "/etc/sysctl.conf";

/// The value of kernel.panic in a file of sysctl.d(5).
std::optional<std::string> panicIn(const std::string& text) {
  constexpr std::string_view names[] = {"kernel.panic", "kernel/panic", "-kernel.panic", "-kernel/panic"};
  std::optional<std::string> value;
  for (const auto& line : configurationLines(text, "#;")) {
    const auto words = split(line, " \t=");
    if (words.size() == 2 && std::ranges::find(names, words[0]) != std::end(names)) value = words[1];
  }
  return value;
}

}  // namespace

bool isOnPanic(const std::string& seconds) {
  return leadingInteger(seconds) != 0;
}

Result<KernelPanic::Stored> KernelPanic::stored() const {
  const auto parameter = kernelParameter(_machine.root, "panic");
  if (!parameter) return parameter.failure();
  auto files = configurationFiles(
      _machine.root, {"/etc/sysctl.d/", "/run/sysctl.d/", "/usr/local/lib/sysctl.d/", "/usr/lib/sysctl.d/"});
  if (!files) return files.failure();
  auto inOrder = std::move(files).value();
  if (!_machine.services.hasServiceManager()) inOrder.emplace_back(mainPanicFile);
  Stored found;
  if (*parameter) found = {**parameter, kernelCommandLine, std::nullopt, **parameter, kernelCommandLine};
  for (const auto& file : inOrder) {
    const auto text = orEmpty(_machine.root.read(file, configurationLimit));
    if (!text) return text.failure();
    const auto value = panicIn(*text);
    if (!value) continue;
    found.seconds = *value;
    found.from = file;
    if (file == _file.path()) {
      found.own = *value;
    } else {
      found.others = *value;
      found.othersFrom = file;
    }
  }
  return found;
}

Result<bool> KernelPanic::isStored() const {
  const auto panic = stored();
  if (!panic) return panic.failure();
  return isOnPanic(panic->seconds);
}

/// Where others have a value to restart there is no need of the tool's own.
Result<void> KernelPanic::check(bool restarts) const {
  const auto before = stored();
  if (!before) return before.failure();
  const auto& others = before->othersFrom;
  if (restarts && !isOnPanic(before->others)) {
    const bool isLater = others == mainPanicFile || baseName(others) > baseName(_file.path());
    return _file.check(isLater && others != kernelCommandLine ? others : "");
  }
  const auto failure = before->own ? whyNeedsRoot("remove", _file.path()) : std::nullopt;
  return failure ? Result<void>(*failure) : Result<void>();
}

Result<void> KernelPanic::store(bool restarts) const {
  const auto before = stored();
  if (!before) return before.failure();
  if (!restarts || isOnPanic(before->others)) return before->own ? _machine.root.remove(_file.path()) : Result<void>();
  const auto hidingFile = [&] {
    const auto after = stored();
    return after ? after->from : "";
  };
  return _file.changeIfHeeded(
      {.write = [&] { return _file.replace(std::string("kernel.panic = ") + ownPanicSeconds + "\n"); },
       .isHeeded = [&] { return isStored(); },
       .hidingFile = hidingFile});
}

Result<void> KernelPanic::apply(bool restarts) const {
  const auto seconds = readKernelFile(_machine.root, panicFile);
  if (!seconds) return seconds.failure();
  if (restarts && isOnPanic(*seconds)) return {};
  const auto panic = stored();
  if (!panic) return panic.failure();
  const auto wanted = isOnPanic(panic->others) ? panic->others : restarts ? ownPanicSeconds : "0";
  return wanted == *seconds ? Result<void>() : writeKernelFile(_machine.root, panicFile, wanted);
}

Result<void> KernelPanic::applyStored() const {
  const auto panic = stored();
  if (!panic) return panic.failure();
  const auto seconds = readKernelFile(_machine.root, panicFile);
  if (!seconds) return seconds.failure();
  return panic->seconds == *seconds ? Result<void>() : writeKernelFile(_machine.root, panicFile, panic->seconds);
}

}  // namespace tavisk

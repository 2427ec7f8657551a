// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/Firmware.h"

#include <algorithm>
#include <string_view>
#include <utility>

namespace tavisk {
namespace {

constexpr const char* nvramTool = "/usr/sbin/nvram";
constexpr int generationsToCarrier = 2;
constexpr std::string_view deviceTreePrefix = "IODeviceTree:";

bool isAscii(std::string_view text) {
  return std::ranges::all_of(text, [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

/// Whether a list of texts, each ended by a NUL byte, has this one.
bool listHas(const IORegistry::Data& list, std::string_view wanted) {
  for (auto begin = list.begin();;) {
    const auto end = std::find(begin, list.end(), std::uint8_t{0});
    if (end == list.end()) return false;
    if (std::equal(begin, end, wanted.begin(), wanted.end())) return true;
    begin = end + 1;
  }
}

/// The device that carries the service: its parent's parent.
std::optional<RegistryEntry> carrierOf(SDEnvironment& environment, RegistryEntry entry) {
  for (int generation = 0; generation < generationsToCarrier; ++generation) {
    auto [status, parent] = environment.host.registry().parent(entry, RegistryPlane::service);
    if (status != 0) {
      environment.log.always("%s IORegistryEntryGetParentEntry %08x", {"getOFPathForBSDName", status});
      return std::nullopt;
    }
    entry = std::move(parent);
  }
  return entry;
}

std::optional<std::map<std::string, std::string>> interfacesByPath(SDEnvironment& environment) {
  const auto addresses = environment.host.networkInterfaces().addresses();
  if (!addresses) return std::nullopt;
  std::map<std::string, std::string> interfaces;
  for (const auto& address : *addresses) {
    if (!address.up || address.loopback || !address.ipv4) continue;
    if (const auto path = getOFPathForBSDName(environment, address.interface)) interfaces[*path] = address.interface;
  }
  return interfaces;
}

}  // namespace

std::optional<std::string> runNVRAMTool(SDEnvironment& environment, const std::string& argument) {
  if (environment.host.diskManagement().preBootEnvironment() == preboot::openFirmware) return std::nullopt;
  const auto output = environment.host.programs().run(nvramTool, {argument});
  if (!output) return std::nullopt;
  environment.log.debug("%@ %@ (exit status %d)", {nvramTool, argument, output->exitStatus});
  if (output->exitStatus != 0 || !isAscii(output->text)) return std::nullopt;
  if (output->text.size() <= argument.size() + 2) return std::nullopt;
  auto value = output->text.substr(argument.size() + 1);
  if (value.ends_with('\n')) value.pop_back();
  return value;
}

bool machineHasHalbRISCCompatible(SDEnvironment& environment) {
  auto& registry = environment.host.registry();
  if (const auto status = registry.masterPort(); status != 0) {
    environment.log.debug("IOMasterPort() returned %d", {status});
    return true;
  }
  const auto root = registry.entryAtPath("IODeviceTree:/");
  if (!root) {
    environment.log.debug("IORegistryEntryFromPath() returned nil");
    return true;
  }
  const auto compatible = registry.dataProperty(*root, "compatible");
  if (!compatible) {
    environment.log.debug("IORegistryEntryCreateCFProperty() returned nil");
    return true;
  }
  return listHas(*compatible, "HalbRISC");
}

std::string machineModelString(SDEnvironment& environment) {
  return environment.host.kernel().model();
}

std::optional<std::string> getOFPathForBSDName(SDEnvironment& environment, const std::string& bsdName) {
  auto& registry = environment.host.registry();
  const auto service = registry.serviceNamed(bsdName);
  const auto carrier = service ? carrierOf(environment, *service) : std::nullopt;
  if (!carrier) return std::nullopt;
  const auto [status, path] = registry.path(*carrier, RegistryPlane::deviceTree);
  if (status != 0) {
    environment.log.always("%s IORegistryEntryGetPath %08x", {"getOFPathForBSDName", status});
    return std::nullopt;
  }
  return path.substr(std::min(path.size(), deviceTreePrefix.size()));
}

std::optional<std::string> interfaceForOFPath(SDEnvironment& environment, const std::optional<std::string>& path) {
  auto& known = environment.facts.interfaceOfPath;
  if (!known) known = interfacesByPath(environment);
  if (!known || !path) return std::nullopt;
  const auto interface = known->find(*path);
  return interface == known->end() ? std::nullopt : std::optional(interface->second);
}

}  // namespace tavisk

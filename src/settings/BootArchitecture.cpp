// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <optional>

#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

constexpr const char* architectureKey = "Kernel Architecture";

}  // namespace

void ServerCommands::getKernelBootArchitectureSetting() {
  const std::optional<PropertyList::Dictionary> settings = _context.host.bootLoaderFile().read();
  const PropertyList* value = settings ? settings->find(architectureKey) : nullptr;
  if (const std::string* architecture = value ? value->asString() : nullptr) {
    _context.output.print("kernel architecture is set to: %s\n", architecture->c_str());
  } else {
    _context.output.putLine("kernel architecture is set to default");
  }
}

void ServerCommands::setKernelBootArchitecture(const std::string& architecture) {
  if (architecture == "i386" || architecture == "x86_64") {
    chooseKernelArchitecture(architecture);
  } else if (caseInsensitiveEqualTo(architecture, "default")) {
    chooseDefaultKernelArchitecture();
  } else {
    _context.output.putLine("Invalid argument. Valid arguments are i386, x86_64, or default.");
  }
}

void ServerCommands::chooseKernelArchitecture(const std::string& architecture) {
  BootLoaderFile& file = _context.host.bootLoaderFile();
  PropertyList::Dictionary settings = file.read().value_or(PropertyList::Dictionary());
  settings.set(architectureKey, architecture);
  _context.output.print("setting kernel architecture to: %s\n", architecture.c_str());
  tellWhetherSaved(file.write(settings));
}

void ServerCommands::chooseDefaultKernelArchitecture() {
  BootLoaderFile& file = _context.host.bootLoaderFile();
  std::optional<PropertyList::Dictionary> settings = file.read();
  if (settings) settings->remove(architectureKey);
  _context.output.putLine("setting kernel architecture to default");
  tellWhetherSaved(settings && file.write(*settings));
}

void ServerCommands::tellWhetherSaved(bool saved) {
  _context.output.putLine(saved ? "changes to kernel architecture have been saved."
                                : "changes to kernel architecture failed to save!");
}

HandlerRows bootArchitectureHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getKernelBootArchitectureSetting", &ServerCommands::getKernelBootArchitectureSetting},
      {"setKernelBootArchitecture:", &ServerCommands::setKernelBootArchitecture},
  };
  return rows;
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

using Properties = PropertyList::Dictionary;

void tellWhetherSaved(Output& output, bool isSaved) {
  output.putLine(isSaved ? "changes to kernel architecture have been saved."
                         : "changes to kernel architecture failed to save!");
}

void chooseArchitecture(const CommandContext& context, const std::string& architecture) {
  auto& file = context.host.bootLoaderFile();
  auto settings = file.read().valueOr(std::nullopt).value_or(Properties());
  settings.set(BootLoaderFile::architectureKey, architecture);
  context.output.print("setting kernel architecture to: %s\n", architecture.c_str());
  tellWhetherSaved(context.output, file.write(settings));
}

/// False when there is no file to take the architecture out of; none is made for that.
bool chooseDefaultArchitecture(const CommandContext& context) {
  auto& file = context.host.bootLoaderFile();
  const auto found = file.read();
  auto settings = found.valueOr(std::nullopt);
  if (settings) settings->remove(BootLoaderFile::architectureKey);
  context.output.putLine("setting kernel architecture to default");
  tellWhetherSaved(context.output, settings && file.write(*settings));
  return !found || *found;
}

}  // namespace

void ServerCommands::getKernelBootArchitectureSetting() {
  const auto settings = _context.host.bootLoaderFile().read().valueOr(std::nullopt);
  const auto* value = settings ? settings->find(BootLoaderFile::architectureKey) : nullptr;
  if (value) {
    _context.output.print("kernel architecture is set to: %s\n", plainText(*value).c_str());
  } else {
    _context.output.putLine("kernel architecture is set to default");
  }
}

void ServerCommands::setKernelBootArchitecture(const std::string& architecture) {
  if (architecture == "i386" || architecture == "x86_64") {
    chooseArchitecture(_context, architecture);
  } else if (caseInsensitiveEqualTo(architecture, "default")) {
    if (!chooseDefaultArchitecture(_context)) refuse("i386 or x86_64, as there is no file that could be set back");
  } else {
    _context.output.putLine("Invalid argument. Valid arguments are i386, x86_64, or default.");
    refuse("i386, x86_64 or default");
  }
}

HandlerRows bootArchitectureHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getKernelBootArchitectureSetting", &ServerCommands::getKernelBootArchitectureSetting},
      {"setKernelBootArchitecture:", &ServerCommands::setKernelBootArchitecture},
  };
  return rows;
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/KernelArchitecture.h"

#include <memory>
#include <utility>

#include "effects/SettingNames.h"
#include "hosts/shared/SettingReset.h"

namespace tavisk {
namespace {

using Contents = Result<std::optional<PropertyList::Dictionary>>;

Result<std::optional<std::string>> architectureOf(const Contents& read) {
  if (!read) return read.failure();
  return architectureIn(read->value_or(PropertyList::Dictionary()));
}

/// The file as it is, with the architecture of the contents.
PropertyList::Dictionary changed(PropertyList::Dictionary file, const PropertyList::Dictionary& contents) {
  for (const auto& [key, value] : contents)
    if (key == BootLoaderFile::architectureKey || !file.find(key)) file.set(key, value);
  if (!contents.find(BootLoaderFile::architectureKey)) file.remove(BootLoaderFile::architectureKey);
  return file;
}

}  // namespace

std::string architectureIn(const PropertyList::Dictionary& contents) {
  const auto* value = contents.find(BootLoaderFile::architectureKey);
  return value ? plainText(*value) : "default";
}

Setting<std::string> kernelArchitecture(const Contents& read) {
  Setting<std::string> setting;
  setting.name = setting::kernelArchitecture;
  setting.where = BootLoaderFile::path;
  setting.stored = [&read] { return architectureOf(read); };
  return setting;
}

Setting<std::string> kernelArchitecture(const PropertyListFile& file) {
  Setting<std::string> setting;
  setting.name = setting::kernelArchitecture;
  setting.where = file.path();
  setting.stored = [&file] { return architectureOf(file.read()); };
  setting.own = ownKey(file, BootLoaderFile::architectureKey);
  return setting;
}

Setting<std::string> kernelArchitecture(const PropertyListFile& file, const PropertyList::Dictionary& contents) {
  auto setting = kernelArchitecture(file);
  const auto places = std::make_shared<WrittenPlaces>();
  setting.written = [places] { return places->text(); };
  setting.store = [&file, &contents, places](const std::string&) -> Result<void> {
    auto present = file.readToChange();
    if (!present) return present.failure();
    return file.write(changed(std::move(present).value(), contents), *places);
  };
  // Also when nothing changes: whether the file can be written is what is asked for.
  setting.always = true;
  return setting;
}

}  // namespace tavisk

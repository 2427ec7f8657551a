// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/BootLoaderFile.h"

#include "platform/SettingNames.h"

namespace tavisk {

std::string architectureIn(const PropertyList::Dictionary& contents) {
  const PropertyList* value = contents.find(BootLoaderFile::architectureKey);
  const std::string* architecture = value ? value->asString() : nullptr;
  return architecture ? *architecture : "default";
}

Setting kernelArchitecture(const PropertyListFile& file, const PropertyList::Dictionary& contents) {
  Setting setting;
  setting.name = setting::kernelArchitecture;
  setting.where = file.path();
  setting.stored = [&file]() -> Result<std::optional<std::string>> {
    const Result<std::optional<PropertyList::Dictionary>> found = file.read();
    if (!found) return found.failure();
    return std::optional(architectureIn(found->value_or(PropertyList::Dictionary())));
  };
  setting.store = [&file, &contents](const std::string&) { return file.write(contents); };
  // Also when nothing changes: whether the file can be written is what is asked for.
  setting.always = true;
  return setting;
}

}  // namespace tavisk

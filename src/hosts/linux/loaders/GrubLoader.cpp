// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/GrubLoader.h"

#include <utility>

#include "base/Path.h"
#include "hosts/linux/loaders/GrubFiles.h"
#include "hosts/linux/loaders/GrubMenu.h"
#include "hosts/linux/loaders/SystemStarts.h"

namespace tavisk::grub {
namespace {

constexpr const char* once = "next_entry";
constexpr const char* saved = "saved_entry";
constexpr const char* savedBefore = "prev_saved_entry";  // what an older grub-reboot keeps beside "saved_entry"

Failure cannotChoose(std::string on, std::string why) {
  return {"choose by GRUB's saved entry", std::move(on), std::move(why)};
}

std::string valueOrEmpty(const Environment& environment, const char* name) {
  const auto found = environment.find(name);
  return found == environment.end() ? "" : found->second;
}

/// What the environment block says when what is for once is done.
Environment afterOnce(const Environment& environment) {
  Environment replaced{{once, ""}};
  const auto before = valueOrEmpty(environment, savedBefore);
  if (!before.empty()) replaced.insert({{saved, before}, {savedBefore, ""}});
  return replaced;
}

/// One GRUB and the machine that it is on. Nothing is owned.
class Menus {
 public:
  Menus(const Volumes& volumes, const Beginning& beginning)
      : _volumes(volumes), _beginning(beginning), _files(volumes), _reader(_files, beginning.variables) {}

  Result<Menu> menu(const Environment& replaced) const {
    return _beginning.text.empty() ? _reader.menuOf(_beginning.configuration, replaced)
                                   : _reader.menuOfText(_beginning.text, replaced);
  }

  Result<SystemStart> systemOf(const Result<Start>& start) const {
    if (!start) return start.failure();
    if (!start->isKernel) return notProven(start->program.path, "it is another loader");
    const auto volume = _files.volumeOf(start->program);
    if (!volume) return volume.failure();
    return startOfKernel(_volumes, **volume, start->program.path, start->commandLine);
  }

  Result<SystemStart> systemOfDefault(const Result<Menu>& menu) const {
    return menu ? systemOf(_reader.startOfDefault(*menu)) : menu.failure();
  }

  std::vector<SystemStart> systemsOf(const Menu& menu) const {
    std::vector<SystemStart> systems;
    for (const auto& [choice, start] : _reader.startsOf(menu)) {
      auto system = systemOf(start);
      if (!system) continue;
      systems.push_back(std::move(system).value());
      systems.back().choice = choice;
    }
    return systems;
  }

  Environment environmentOf(const Menu& menu) const {
    const auto block = menu.environment ? _files.read(*menu.environment) : Failure{};
    return block ? environmentIn(*block).value_or(Environment()) : Environment();
  }

  std::string text(const FilePlace& place) const {
    const auto volume = _files.volumeOf(place);
    return volume ? placeText(**volume, place.path) : place.path;
  }

  LoaderDefault defaultOf(const Menu& menu) const {
    const auto volume = menu.environment ? _files.volumeOf(*menu.environment) : Failure{};
    if (!volume) return {};
    return {LoaderDefault::Kind::environmentBlock, (*volume)->device.name, menu.environment->path};
  }

  /// Where its tools keep the environment block, whether it is loaded or not.
  Result<bool> hasBlock(const Menu& menu) const {
    auto place = menu.configuration;
    place.path = folderOf(place.path) + "/grubenv";
    return _files.isThere(place);
  }

 private:
  const Volumes& _volumes;
  const Beginning& _beginning;
  VolumeFiles _files;
  MenuReader _reader;
};

/// What makes a menu follow its saved entry (GNU GRUB Manual 2.12, "Simple configuration handling").
std::string howToFollow(const std::string& configuration) {
  const bool isTwo = configuration.find("/grub2/") != std::string::npos;
  return std::string("its configuration does not start the saved entry; set GRUB_DEFAULT=saved in /etc/default/grub ") +
         "of the system that the menu is of, and run " +
         (isTwo ? "grub2-mkconfig -o /boot/grub2/grub.cfg there" : "update-grub there");
}

Failure noBlock(const std::string& where) {
  return cannotChoose(where, "there is no environment block; \"grub-editenv - create\" in that system makes one");
}

std::optional<Failure> whyNotWritten(const Volumes& volumes, const LoaderDefault& keeps, const std::string& choice) {
  for (const auto& volume : volumes.all()) {
    if (volume.device.name != keeps.volume) continue;
    const auto block = volumes.read(volume, keeps.path, environmentSize);
    if (!block && isAbsent(block.failure())) return noBlock(placeText(volume, keeps.path));
    if (!block) return block.failure();
    const auto environment = environmentIn(*block);
    if (environment && !valueOrEmpty(*environment, savedBefore).empty())
      return cannotChoose(placeText(volume, keeps.path), "another entry is for once, and the one before comes back");
    const auto written = withVariable(*block, saved, choice);
    return written ? std::nullopt : std::optional(written.failure());
  }
  return cannotChoose(keeps.path, "its volume is not there any more");
}

}  // namespace

LoaderReading readMenu(const Volumes& volumes, const Beginning& beginning) {
  LoaderReading reading;
  reading.loader = "GRUB";
  reading.grub = std::make_shared<const Beginning>(beginning);
  const Menus menus(volumes, beginning);
  const auto menu = menus.menu({});
  reading.next = menus.systemOfDefault(menu);
  reading.lasting = reading.next;
  if (!menu) return reading;
  reading.configuration = menus.text(menu->configuration);
  reading.keeps = menus.defaultOf(*menu);
  const auto environment = menus.environmentOf(*menu);
  if (const auto entry = valueOrEmpty(environment, once); !entry.empty()) reading.once = entry;
  const auto lasting = menus.menu(afterOnce(environment));
  reading.lasting = menus.systemOfDefault(lasting);
  if (lasting) reading.starts = menus.systemsOf(*lasting);
  return reading;
}

std::optional<Failure> whyNotChosen(const Volumes& volumes, const LoaderReading& reading, const SystemStart& start) {
  const Menus menus(volumes, *reading.grub);
  const auto menu = menus.menu({{once, ""}, {saved, start.choice}});
  if (!menu) return menu.failure();
  const auto hasBlock = menus.hasBlock(*menu);
  if (reading.keeps.kind == LoaderDefault::Kind::none && hasBlock && !*hasBlock) return noBlock(reading.configuration);
  if (reading.keeps.kind == LoaderDefault::Kind::none)
    return cannotChoose(reading.configuration, howToFollow(reading.configuration));
  if (auto failure = whyNotWritten(volumes, reading.keeps, start.choice)) return failure;
  const auto system = menus.systemOfDefault(menu);
  if (!system) return system.failure();
  if (!system->isSameSystem(start)) return cannotChoose(reading.configuration, howToFollow(reading.configuration));
  return std::nullopt;
}

}  // namespace tavisk::grub

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/WakeOnNetworkAccess.h"

#include "base/Path.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/OtherOwners.h"
#include "hosts/linux/power/PowerValues.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/SysDevice.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* cardFolder = "/sys/class/net/";
constexpr const char* usualLinkFile = "99-default.link";
constexpr const char* hidingLink = "/etc/systemd/network/99-default.link";
constexpr const char* section = "Link";
constexpr const char* key = "WakeOnLan";
constexpr std::size_t fileLimit = 65536;

/// Of a card on a USB or platform bus it is often the device above that wakes; of a PCI card it is the card.
bool isKnownToWake(const std::optional<SysDevice>& device) {
  if (!device || device->canWake()) return device.has_value();
  const auto above = device->subsystem() == "pci" ? std::nullopt : device->parent();
  return above && above->canWake();
}

}  // namespace

Result<bool> WakeOnNetworkAccess::canWake(const std::string& card) const {
  if (!isKnownToWake(SysDevice::at(_machine.root, cardFolder + card + "/device"))) return false;
  const auto modes = _cards.wakeModes(card);
  if (!modes) return modes.failure();
  return (modes->supported & magicPacket) != 0;
}

Result<std::vector<std::string>> WakeOnNetworkAccess::wakingCards() const {
  std::vector<std::string> found;
  for (const auto& card : _machine.root.list(cardFolder).valueOr({})) {
    const auto can = canWake(card);
    if (!can) return can.failure();
    if (*can) found.push_back(card);
  }
  return found;
}

/// Cards that cannot be asked are no reason: whatever is done with them then tells why.
std::optional<Failure> WakeOnNetworkAccess::whyNoCard() const {
  const auto cards = wakingCards();
  if (!cards || !cards->empty()) return std::nullopt;
  return Failure{"find", "/sys/class/net", "no network card here can wake the machine"};
}

Result<std::optional<std::string>> WakeOnNetworkAccess::live() const {
  const auto cards = wakingCards();
  if (!cards) return cards.failure();
  std::vector<DeviceValue> values;
  for (const auto& card : *cards) {
    const auto modes = _cards.wakeModes(card);
    if (!modes) return modes.failure();
    values.push_back({card, onOff(modes->enabled != 0)});
  }
  return std::optional(valueOfAll(values));
}

Result<void> WakeOnNetworkAccess::apply(const std::string& value) const {
  const auto cards = wakingCards();
  if (!cards) return cards.failure();
  Result<void> all;
  for (const auto& card : *cards)
    if (auto set = _cards.setWakeModes(card, isOn(value) ? magicPacket : 0); !set && all) all = set;
  return all;
}

/// The device manager notes by which file it has set up a card.
std::string WakeOnNetworkAccess::linkFileOf(const std::string& card) const {
  const auto number = readKernelFile(_machine.root, cardFolder + card + "/ifindex").valueOr("");
  const auto facts = _machine.root.read("/run/udev/data/n" + number, fileLimit).valueOr("");
  for (const auto& line : configurationLines(facts))
    if (const auto fact = namedValueIn(line); fact && fact->name == "E:ID_NET_LINK_FILE") return baseName(fact->value);
  return usualLinkFile;
}

/// The usual one as well, for cards that are still to come.
std::set<std::string> WakeOnNetworkAccess::dropIns() const {
  std::set<std::string> files{ownfile::linkDropIn(usualLinkFile)};
  for (const auto& card : wakingCards().valueOr({})) files.insert(ownfile::linkDropIn(linkFileOf(card)));
  return files;
}

Result<std::optional<std::string>> WakeOnNetworkAccess::stored() const {
  std::vector<DeviceValue> values;
  for (const auto& file : dropIns()) {
    const auto words = assignments(_machine.root.read(file, fileLimit).valueOr(""), section, key);
    values.push_back({file, words.empty() ? "" : onOff(words.back() != "off")});
  }
  auto value = valueOfAll(values);
  return value.empty() ? std::nullopt : std::optional(std::move(value));
}

Result<void> WakeOnNetworkAccess::store(const std::string& value) const {
  for (const auto& file : dropIns()) {
    if (auto failure = whyNeedsRoot("write", file)) return *failure;
    const auto text = std::string(ownfile::header) + "[Link]\nWakeOnLan=" + (isOn(value) ? "magic" : "off") + "\n";
    if (auto written = _machine.root.write(file, text); !written) return written;
  }
  return {};
}

Setting<std::string> WakeOnNetworkAccess::wakeOnNetworkAccess() const {
  Setting<std::string> setting;
  setting.name = setting::wakeOnNetworkAccess;
  setting.supported = [this] { return whyNoCard(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  return setting;
}

Setting<std::string> WakeOnNetworkAccess::wakeOnNetworkAccessChange() const {
  auto setting = wakeOnNetworkAccess();
  setting.where = ownfile::linkDropIn(usualLinkFile);
  if (!_machine.root.exists("/run/udev/control"))
    setting.note = saying("no device manager runs here: lasts until the restart");
  else if (_machine.root.readLink(hidingLink).valueOr("") == "/dev/null")
    setting.note = [text = std::string(std::string(hidingLink) + " hides the file: lasts until the restart")](
                       const auto&) { return text; };
  setting.undoneBy = [this](const auto&) {
    return ownersAtWork(_machine.root, {OtherOwner::tlp, OtherOwner::networkManager});
  };
  setting.store = [this](const std::string& value) { return store(value); };
  setting.apply = [this](const std::string& value) { return apply(value); };
  return setting;
}

}  // namespace tavisk

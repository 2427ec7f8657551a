// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/WakeOnNetworkAccess.h"

#include <linux/ethtool.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <cerrno>
#include <memory>
#include <set>

#include "base/FileDescriptor.h"
#include "base/Path.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/power/OtherOwners.h"
#include "hosts/linux/power/PowerLimits.h"
#include "hosts/linux/power/UdevRule.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/SysDevice.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

static_assert(magicPacket == WAKE_MAGIC);

constexpr const char* cardFolder = "/sys/class/net/";
constexpr const char* linkFolder = "/etc/systemd/network";
constexpr const char* usualLinkFile = "99-default.link";
constexpr const char* linkSection = "Link";
constexpr const char* wakeKey = "WakeOnLan";
constexpr const char* never = "off";
constexpr const char* magic = "magic";

/// A link file and its drop-ins are found as other configurations of the service manager are (systemd.link(5)).
SystemdConfig configOf(const SystemRoot& root, const std::string& linkFile) {
  return {root, "network/" + linkFile};
}

Failure failureOf(const char* tried, const std::string& card, int error) {
  const auto forRoot = error == EPERM ? whyNeedsRoot(tried, card) : std::nullopt;
  return forRoot.value_or(systemFailure(tried, card, error));
}

/// Passes a request on to the driver of the card, which may fill it in.
Result<void> ask(const char* tried, const std::string& card, ethtool_wolinfo& modes) {
  const FileDescriptor socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!socket) return failureOf(tried, card, errno);
  ifreq request{};
  card.copy(request.ifr_name, sizeof request.ifr_name - 1);
  request.ifr_data = reinterpret_cast<char*>(&modes);
  if (::ioctl(socket.number(), SIOCETHTOOL, &request) != 0) return failureOf(tried, card, errno);
  return {};
}

/// Of a card on a USB or platform bus it is often the device above that wakes; of a PCI card it is the card.
Result<bool> isKnownToWake(const SysDevice& device) {
  auto canWake = device.canWake();
  if (!canWake || *canWake) return canWake;
  const auto subsystem = device.subsystem();
  if (!subsystem) return subsystem.failure();
  const auto above = *subsystem == "pci" ? std::nullopt : device.parent();
  return above ? above->canWake() : false;
}

}  // namespace

Result<WakeModes> KernelNetworkCards::wakeModes(const std::string& card) {
  if (_root.prefix() != "/") return WakeModes{};
  ethtool_wolinfo modes{};
  modes.cmd = ETHTOOL_GWOL;
  const auto answer = ask("ETHTOOL_GWOL", card, modes);
  if (answer) return WakeModes{modes.supported, modes.wolopts};
  const auto& error = answer.failure().code;
  if (error == std::errc::operation_not_supported || error == std::errc::no_such_device) return WakeModes{};
  return answer.failure();
}

Result<void> KernelNetworkCards::setWakeModes(const std::string& card, std::uint32_t modes) {
  constexpr const char* tried = "ETHTOOL_SWOL";
  if (_root.prefix() != "/") return Failure{tried, card, "a tree of files has no network cards"};
  ethtool_wolinfo wanted{};
  wanted.cmd = ETHTOOL_SWOL;
  wanted.wolopts = modes;
  const auto done = ask(tried, card, wanted);
  return !done && done.failure().code == std::errc::no_such_device ? Result<void>() : done;
}

Result<std::optional<std::string>> WakeOnNetworkAccess::wakingCard(const std::string& card) const {
  const auto device = SysDevice::at(_machine.root, cardFolder + card + "/device");
  if (!device) return device.failure();
  if (!*device) return std::nullopt;
  const auto isKnown = isKnownToWake(**device);
  if (!isKnown) return isKnown.failure();
  if (!*isKnown) return std::nullopt;
  const auto modes = _cards.wakeModes(card);
  if (!modes) return modes.failure();
  return (modes->supported & magicPacket) != 0 ? std::optional(card) : std::nullopt;
}

Result<std::vector<std::string>> WakeOnNetworkAccess::wakingCards() const {
  return ofEachIn(_machine.root, cardFolder, [this](const std::string& card) { return wakingCard(card); });
}

Support WakeOnNetworkAccess::supported() const {
  return supportBy(wakingCards(), {"find", "/sys/class/net", "no network card here can wake the machine"});
}

Setting<bool>::Found WakeOnNetworkAccess::live() const {
  const auto valueOf = [this](const std::string& card) -> Result<std::optional<DeviceValue<bool>>> {
    const auto modes = _cards.wakeModes(card);
    if (!modes) return modes.failure();
    return DeviceValue<bool>{card, modes->enabled != 0};
  };
  return readingOfAll(ofEach(wakingCards(), valueOf));
}

Result<void> WakeOnNetworkAccess::apply(bool wakes) const {
  return setEach(wakingCards(),
                 [&](const std::string& card) { return _cards.setWakeModes(card, wakes ? magicPacket : 0); });
}

/// The device manager notes by which file it has set up a card.
Result<std::string> WakeOnNetworkAccess::linkFileOf(const std::string& card) const {
  const auto number = orGone(readKernelFile(_machine.root, cardFolder + card + "/ifindex"));
  if (!number) return number.failure();
  const auto facts = orEmpty(_machine.root.read("/run/udev/data/n" + number->value_or(""), powerFileLimit));
  if (!facts) return facts.failure();
  for (const auto& line : configurationLines(*facts))
    if (const auto fact = namedValueIn(line); fact && fact->name == "E:ID_NET_LINK_FILE") return baseName(fact->value);
  return usualLinkFile;
}

Result<bool> WakeOnNetworkAccess::isMasked(const std::string& linkFile) const {
  const auto target = _machine.root.standardized("/etc/systemd/network/" + linkFile);
  if (!target) return target.failure();
  return *target == "/dev/null";
}

/// The usual one as well, for cards that are still to come.
Result<std::vector<std::string>> WakeOnNetworkAccess::linkFiles() const {
  const auto cards = wakingCards();
  if (!cards) return cards.failure();
  std::set<std::string> files{usualLinkFile};
  for (const auto& card : *cards) {
    const auto file = linkFileOf(card);
    if (!file) return file.failure();
    files.insert(*file);
  }
  return ofEach(files, [this](const std::string& file) -> Result<std::optional<std::string>> {
    const auto masked = isMasked(file);
    if (!masked) return masked.failure();
    return *masked ? std::nullopt : std::optional(file);
  });
}

Setting<bool>::Found WakeOnNetworkAccess::stored() const {
  const auto files = linkFiles();
  if (!files) return files.failure();
  std::vector<DeviceValue<bool>> all;
  std::vector<std::pair<std::string, bool>> waiting;
  for (const auto& file : *files) {
    const auto config = configOf(_machine.root, file);
    const auto word = config.last(linkSection, wakeKey);
    if (!word) return word.failure();
    const auto own = config.own(linkSection, wakeKey);
    if (!own) return own.failure();
    const auto wakes = *word ? std::optional((*word)->value != never) : std::nullopt;
    all.push_back({file, wakes});
    if (*own && wakes != (**own != never)) waiting.emplace_back(config.ownDropIn(), **own != never);
  }
  auto found = readingOfAll<bool>(all);
  if (!found || !*found) return found;
  auto reading = **found;
  for (const auto& [file, own] : waiting) reading = whileWaits(reading, own, file);
  return reading;
}

std::string WakeOnNetworkAccess::whatHides(const std::string& linkFile, bool wakes) const {
  const auto isAsAsked = [wakes](const std::string& word) { return (word != never) == wakes; };
  return configOf(_machine.root, linkFile).whatHides(linkSection, wakeKey, isAsAsked).valueOr("");
}

Result<void> WakeOnNetworkAccess::storeIn(const std::string& linkFile, bool wakes, WrittenPlaces& written) const {
  const auto config = configOf(_machine.root, linkFile);
  const auto isHeeded = [&]() -> Result<bool> {
    const auto word = config.last(linkSection, wakeKey);
    if (!word) return word.failure();
    return *word && ((*word)->value != never) == wakes;
  };
  const std::map<std::string, std::string> values{{wakeKey, wakes ? magic : never}};
  const OwnFile own(_machine.root, config.ownDropIn());
  return own.noting(written, [&] {
    return own.changeIfHeeded({.write = [&] { return config.setOwn(linkSection, values); },
                               .isHeeded = isHeeded,
                               .hidingFile = [&] { return whatHides(linkFile, wakes); }});
  });
}

Result<std::vector<OwnFile>> WakeOnNetworkAccess::ownDropIns() const {
  return ofEachIn(_machine.root, linkFolder, [this](const std::string& name) -> Result<std::optional<OwnFile>> {
    constexpr std::string_view ending = ".d";
    if (!name.ends_with(".link.d")) return std::nullopt;
    const OwnFile file(_machine.root, ownfile::linkDropIn(name.substr(0, name.size() - ending.size())));
    const auto contents = file.contents();
    if (!contents) return contents.failure();
    return *contents ? std::optional(file) : std::nullopt;
  });
}

OwnPart WakeOnNetworkAccess::ownPart() const {
  const auto isThere = [this]() -> Result<bool> {
    const auto files = ownDropIns();
    if (!files) return files.failure();
    return !files->empty();
  };
  const auto check = [this] { return setEach(ownDropIns(), [](const OwnFile& file) { return file.check(); }); };
  const auto takeAway = [this](WrittenPlaces& taken) {
    return setEach(ownDropIns(), [&](const OwnFile& file) { return file.asPart().takeAway(taken); });
  };
  return {.isThere = isThere, .check = check, .takeAway = takeAway};
}

Result<void> WakeOnNetworkAccess::check(bool wakes) const {
  return setEach(linkFiles(), [&](const std::string& file) {
    return OwnFile(_machine.root, configOf(_machine.root, file).ownDropIn()).check(whatHides(file, wakes));
  });
}

Result<void> WakeOnNetworkAccess::store(bool wakes, WrittenPlaces& written) const {
  return setEach(linkFiles(), [&](const std::string& file) { return storeIn(file, wakes, written); });
}

std::string WakeOnNetworkAccess::whatUndoes(bool wakes) const {
  for (const auto& file : linkFiles().valueOr({}))
    if (auto hiding = whatHides(file, wakes); !hiding.empty()) return hiding;
  return ownersAtWork(_machine.root, {OtherOwner::tlp, OtherOwner::networkManager});
}

std::string WakeOnNetworkAccess::whyItDoesNotLast() const {
  auto reason = whyNoRuleLasts(_machine.root);
  const auto files = linkFiles();
  if (!reason.empty() || !files || !files->empty()) return reason;
  return "/etc/systemd/network/" + std::string(usualLinkFile) + " is masked: lasts until the restart";
}

Setting<bool> WakeOnNetworkAccess::wakeOnNetworkAccess() const {
  const auto written = std::make_shared<WrittenPlaces>();
  Setting<bool> setting;
  setting.name = setting::wakeOnNetworkAccess;
  setting.undoneBy = [this](bool wakes) { return whatUndoes(wakes); };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.apply = [this](bool wakes) { return apply(wakes); };
  setting.own = ownPart();
  if (const auto reason = whyItDoesNotLast(); !reason.empty()) {
    setting.note = saying(reason);
    return setting;
  }
  setting.where = ownfile::linkDropIn(usualLinkFile);
  setting.written = [written] { return written->text(); };
  setting.stored = [this] { return stored(); };
  setting.check = [this](bool wakes) { return check(wakes); };
  setting.store = [this, written](bool wakes) { return store(wakes, *written); };
  return setting;
}

}  // namespace tavisk

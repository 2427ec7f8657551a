// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <map>

#include "base/Text.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/power/FakePowerServices.h"
#include "hosts/linux/power/LinuxPowerController.h"
#include "hosts/linux/power/LinuxPowerSettingsService.h"

namespace tavisk {

/// Blanks as the kernel does: after 60 minutes at the latest.
class TreeConsole final : public Console {
 public:
  explicit TreeConsole(LinuxTree& tree) : _tree(tree) {}
  Result<void> write(const std::string& sequence) override {
    const auto minutes = leadingInteger(sequence.substr(std::string("\033[9;").size()));
    _tree.write("/sys/module/kernel/parameters/consoleblank", std::to_string(60 * std::min<std::int64_t>(minutes, 60)));
    return {};
  }

 private:
  LinuxTree& _tree;
};

class TreeCards final : public NetworkCards {
 public:
  struct Card {
    WakeModes modes;
    bool obeys = true;
  };
  Result<WakeModes> wakeModes(const std::string& card) override { return cards[card].modes; }
  Result<void> setWakeModes(const std::string& card, std::uint32_t modes) override {
    if (cards[card].obeys) cards[card].modes.enabled = modes;
    return {};
  }

  std::map<std::string, Card> cards;
};

/// A management controller that keeps a restore policy and a start-up delay.
class TreeController final : public ControllerLink {
 public:
  Result<void> open() override { return error == 0 ? Result<void>() : systemFailure("open", "the tree", error); }
  Result<std::vector<std::uint8_t>> exchange(const ControllerRequest& request) override {
    if (const auto opened = open(); !opened) return opened.failure();
    return answerTo(request);
  }

  int error = 0;
  std::uint8_t policies = 0x07;
  std::uint8_t policy = 0;
  std::uint8_t maker = 0x57;  ///< the low byte of manufacturer 343
  std::vector<std::uint8_t> delay = {0, 0};
  static constexpr std::uint8_t tooLate = 0xC3;  ///< a refusal of what is done all the same
  std::uint8_t delayRefusal = 0;                 ///< a completion code; 0: the delay is taken

 private:
  std::vector<std::uint8_t> answerTo(const ControllerRequest& request) {
    switch (request.function << 8U | request.command) {
      case 0x0601:
        return {0, 0x20, 1, 1, 2, 2, 0x80, maker, 0x01, 0, 0, 0};
      case 0x0001:
        return {0, static_cast<std::uint8_t>(1U | unsigned{policy} << 5U), 0, 0};
      case 0x0006:
        if (request.data.at(0) < 3) policy = request.data[0];
        return {0, policies};
      case 0x3054:
        if (delayRefusal == 0 || delayRefusal == tooLate) delay = request.data;
        return {delayRefusal};
      case 0x3055:
        return delayRefusal == 0xC1 ? std::vector{delayRefusal} : std::vector<std::uint8_t>{0, delay[0], delay[1]};
      default:
        return {0xC1};
    }
  }
};

/// A server with a disk that stops, cards and a serial port that wake, a power button, a watchdog and a management
/// controller, whose services answer over the bus.
class PowerTree : public LinuxTree {
 public:
  PowerTree() {
    addServices();
    addDisk("sda");
    addPort("ttyS0", "00:04");
    addCard("eth0", {{0x2E, 0}});
    write("/sys/class/ipmi/ipmi0/device/type", "kcs\n");
  }
  /// With the devices of a machine that tests/machine/record.sh has looked at.
  explicit PowerTree(const std::string& recording) {
    addServices();
    for (const auto& line : linesOf(std::filesystem::path(TAVISK_RECORDINGS "/disks/recordings") / recording))
      replay(split(line, " "));
  }

  void addServices() {
    for (const auto* mark : {"/run/systemd/system/mark", "/run/udev/control", "/dev/tty1", "/dev/watchdog0",
                             "/sys/bus/acpi/devices/LNXPWRBN:00/path"})
      write(mark, "");
    for (const auto* number : {"/sys/module/kernel/parameters/consoleblank", "/proc/sys/kernel/panic"})
      write(number, "0\n");
  }

  void addDisk(const std::string& name) {
    const auto device = "/sys/devices/pci0000:00/0000:00:1f.2/" + name + "-port/0:0:0:0";
    write(device + "/power/control", "on\n");
    write(device + "/power/autosuspend_delay_ms", "-1\n");
    write(device + "/scsi_disk/0:0:0:0/manage_start_stop", "1\n");
    write(device + "/block/" + name + "/removable", "0\n");
    write(device + "/block/" + name + "/queue/rotational", "1\n");
    link(device + "/block/" + name + "/device", "../..");
    link("/sys/block/" + name, ".." + device.substr(4) + "/block/" + name);
  }
  std::string diskFile(const std::string& disk, const std::string& name) const {
    return file("/sys/devices/pci0000:00/0000:00:1f.2/" + disk + "-port/0:0:0:0/" + name);
  }
  /// The port's terminal has a file power/wakeup, as on every machine.
  /// Since Linux 6.6 two devices are between the place and the terminal.
  void addPort(const std::string& terminal, const std::string& place, const std::string& between = "") {
    const auto board = "/sys/devices/pnp0/" + place;
    write(board + "/power/wakeup", "disabled\n");
    link(board + "/subsystem", "../../../bus/pnp");
    const auto device = board + between;
    if (!between.empty()) {
      write(device + "/power/wakeup", "disabled\n");
      link(device + "/subsystem", "../../../../../bus/serial-base");
    }
    write(device + "/tty/" + terminal + "/power/wakeup", "disabled\n");
    link(device + "/tty/" + terminal + "/device", "../..");
    link("/sys/class/tty/" + terminal, "../.." + device.substr(4) + "/tty/" + terminal);
  }
  void addCard(const std::string& name, const TreeCards::Card& card) {
    const auto device = "/sys/devices/pci0000:00/" + name + "-slot";
    write(device + "/power/wakeup", "disabled\n");
    link(device + "/subsystem", "../../../bus/pci");
    write(device + "/net/" + name + "/ifindex", "2\n");
    link(device + "/net/" + name + "/device", "../..");
    link("/sys/class/net/" + name, "../.." + device.substr(4) + "/net/" + name);
    cards.cards[name] = card;
  }
  void remove(const std::string& path) { std::filesystem::remove_all(at(path)); }

  LinuxPowerSettingsService& power() { return _power; }
  LinuxPowerController& delays() { return _delays; }
  /// What is asked of this one is foretold.
  LinuxPowerSettingsService& foreteller() { return _foreteller; }

  /// Changes a setting, whatever feeds the machine, and tells what came of it.
  Effect set(SleepTimer timer, Minutes minutes) {
    acting().setUntilSleep(timer, mains, minutes);
    return lastEffect();
  }
  Effect turn(PowerSwitch which, bool on) {
    acting().setOn(which, mains, on);
    return lastEffect();
  }
  Effect setRestartsAfterFreeze(bool restarts) {
    acting().setRestartsAfterFreeze(restarts);
    return lastEffect();
  }

  /// What such a change would come to.
  Effect foretell(const std::function<Effect(PowerTree&)>& change) {
    _isForecast = true;
    auto effect = change(*this);
    _isForecast = false;
    return effect;
  }

  const PowerSource mains{"AC Power"};

  TreeConsole console{*this};
  TreeCards cards;
  TreeController controllerLink;
  FakePowerServices bus{at("/")};

 private:
  void replay(const std::vector<std::string>& words) {
    if (words.at(1) == "->")
      link(words[0], words[2]);
    else
      write(words[0], words.at(2) + "\n");
  }

  LinuxPowerSettingsService& acting() { return _isForecast ? _foreteller : _power; }

  bool _isForecast = false;
  ManagementController _controller{controllerLink};
  LinuxPowerSettingsService _power{machine, {console, cards, _controller}};
  LinuxPowerSettingsService _foreteller{
      {machine.root, machine.effects, machine.runLoop, machine.services, {}, Conduct::forecast},
      {console, cards, _controller}};
  LinuxPowerController _delays{machine, _controller};
};

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <cerrno>
#include <map>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/machine/LinuxPreferences.h"

namespace tavisk {
namespace {

constexpr std::uint8_t lock = 0x02;

/// A controller that tells of the front panel: with these capabilities, in this state.
struct Panel final : ControllerLink {
  Result<void> open() override { return error == 0 ? Result<void>() : systemFailure("open", "the panel", error); }
  Result<std::vector<std::uint8_t>> exchange(const ControllerRequest& request) override {
    ++questions;
    if (const auto opened = open(); !opened) return opened.failure();
    if (request.command == 0) return std::vector<std::uint8_t>{0, capabilities, 0x20, 0x20, 0x20, 0x20};
    return std::vector<std::uint8_t>{0, 0x61, 0, state};
  }

  int questions = 0;
  int error = 0;
  std::uint8_t capabilities = lock;
  std::uint8_t state = 0;
};

constexpr const char* allKeys = "402000000 3803078f800d001 feffffdfffefffff fffffffffffffffe\n";

/// A machine with two keyboards, one of a controller, and buttons.
class PanelTree : public LinuxTree {
 public:
  PanelTree() {
    device("input1", "AT Translated Set 2 keyboard", allKeys);
    device("input2", "USB Keyboard", "fffffffe");
    device("input3", "Virtual Keyboard and Mouse", allKeys);
    device("input4", "Gadget USB", allKeys);
    write("/sys/class/input/input4/id/vendor", "0557\n");
    write("/sys/class/input/input4/id/product", "2419\n");
    device("input5", "Power Button", "10000000000000 0\n");
    device("event1", "AT Translated Set 2 keyboard", allKeys);
  }
  void device(const std::string& name, const char* title, const char* keys) {
    write("/sys/class/input/" + name + "/name", std::string(title) + "\n");
    write("/sys/class/input/" + name + "/capabilities/key", keys);
    write("/sys/class/input/" + name + "/inhibited", "0\n");
  }
  std::string inhibited(const std::string& name) const {
    return file("/sys/class/input/" + name + "/inhibited").substr(0, 1);
  }
  void setDisablesKeyboard(bool disables) {
    ManagementController controller(panel);
    EnclosureLock(machine, controller).setDisablesKeyboard(disables, hold(machine));
  }

  Panel panel;
};

TEST(KeyboardLock, IsResetAgainAfterKeyboardsThatStayedDisabled) {
  constexpr const char* inhibited = "/sys/class/input/input1/inhibited";
  constexpr const char* preferences = "/etc/tavisk/preferences/AnyApplication.plist";
  PanelTree tree;
  ManagementController controller(tree.panel);
  tree.write(preferences,
             std::string("<plist><dict><key>") + DunmereLockEnclosureStateKey + "</key><true/></dict></plist>");
  tree.makeUnreadable(inhibited);
  LinuxPreferencesStore(tree.machine, controller).resetKeyboardLock();
  EXPECT_FALSE(tree.has(preferences));
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed);
  std::filesystem::remove(tree.at(inhibited));
  tree.write(inhibited, "1\n");
  LinuxPreferencesStore(tree.machine, controller).resetKeyboardLock();
  EXPECT_EQ(tree.inhibited("input1"), "0");
  tree.log.effects.clear();
  LinuxPreferencesStore(tree.machine, controller).resetKeyboardLock();
  EXPECT_EQ(tree.log.effects.size(), 1U) << "nothing is left to do";
}

TEST(EnclosureLock, DisablesKeyboardsWhileItIsEngaged) {
  struct Case {
    std::uint8_t state;
    bool disables;
    std::string before;  // of the two keyboards
    char after;
    Outcome outcome;
  };
  constexpr std::uint8_t others = 0x0D;
  using enum Outcome;
  const Case cases[] = {
      {lock, true, "00", '1', applied},           {lock | others, true, "11", '1', unchanged},
      {others, true, "00", '0', unchanged},       {others, true, "11", '0', applied},
      {lock | others, false, "11", '0', applied}, {0, false, "00", '0', unchanged},
      {lock, true, "10", '1', applied},
  };
  std::map<std::string, std::string> texts{
      {"00", "keyboards enabled"}, {"11", "keyboards disabled"}, {"10", "some keyboards disabled"}};
  for (const auto& test : cases) {
    PanelTree tree;
    tree.panel.state = test.state;
    for (const auto number : {0U, 1U})
      tree.write("/sys/class/input/input" + std::to_string(number + 1) + "/inhibited", test.before.substr(number, 1));
    tree.setDisablesKeyboard(test.disables);
    const std::string after(2, test.after);
    EXPECT_EQ(tree.lastEffect(), (Effect{.setting = setting::keyboardLock,
                                         .outcome = test.outcome,
                                         .before = texts[test.before],
                                         .asked = texts[after],
                                         .live = texts[after],
                                         .note = (test.state & lock) != 0 ? "the lock is engaged" : "the lock is open",
                                         .changed = test.outcome == Outcome::applied}));
    EXPECT_EQ(tree.inhibited("input1") + tree.inhibited("input2"), after);
    for (const char* name : {"input3", "input4", "input5", "event1"}) EXPECT_EQ(tree.inhibited(name), "0") << name;
  }
}

TEST(EnclosureLock, LeavesTheKeyboardsOfAMachineThatTellsOfNoLock) {
  for (const auto& [error, why] : {std::pair(0, "no lock of the front panel"), {ENODEV, "this machine has none"}}) {
    PanelTree tree;
    tree.panel.error = error;
    tree.panel.capabilities = 0xFF & ~lock;
    tree.panel.state = lock;
    tree.setDisablesKeyboard(true);
    EXPECT_THAT(tree.lastEffect(), UnsupportedFor(why));
    EXPECT_EQ(tree.lastEffect().note, "") << "what becomes of the preference is told of the preference";
    EXPECT_EQ(tree.inhibited("input1"), "0");
  }
}

TEST(EnclosureLock, IsNotLookedAtByWhoMayNotChangeTheMachine) {
  PanelTree tree;
  ManagementController controller(tree.panel);
  EnclosureLock(tree.machine, controller).setDisablesKeyboard(true, Failure{"lock", "the machine", "held"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("held"));
  EXPECT_EQ(tree.panel.questions, 0);
}

TEST(EnclosureLock, TellsTheKeyboardsBesideTheirPreference) {
  PanelTree tree;
  tree.write("/sys/class/input/input1/inhibited", "1");
  tree.write("/sys/class/input/input2/inhibited", "1");
  ManagementController controller(tree.panel);
  LinuxPreferencesStore preferences(tree.machine, controller);
  tree.log.wants = true;
  EXPECT_FALSE(preferences.value(DunmereLockEnclosureStateKey));
  for (const char* keyboard : {"input1", "input2"})
    tree.write(std::string("/sys/class/input/") + keyboard + "/name", "virtual");
  EXPECT_FALSE(preferences.value(DunmereLockEnclosureStateKey));
  const SettingValue preference{setting::keyboardLockPreference};
  const Failure none{"find a keyboard", "/sys/class/input", "there is none at this machine"};
  EXPECT_THAT(tree.log.values,
              testing::ElementsAre(SettingValue{setting::keyboardLock, "keyboards disabled"}, preference,
                                   SettingValue{setting::keyboardLock, {}, {}, "", none}, preference));
  EXPECT_TRUE(tree.log.effects.empty());
}

TEST(EnclosureLock, SaysWhatCannotBeLookedAtOrDisabled) {
  const std::tuple<const char*, int, const char*> cases[] = {{"inhibited", 0, "input2/inhibited"},
                                                             {"capabilities/key", 0, "input2/capabilities/key"},
                                                             {"id/vendor", 0, "input2/id/vendor"},
                                                             {"name", ETIMEDOUT, "Get Chassis Capabilities"}};
  for (const auto& [file, error, why] : cases) {
    PanelTree tree;
    tree.panel.state = lock;
    tree.panel.error = error;
    tree.makeUnreadable(std::string("/sys/class/input/input2/") + file);
    tree.setDisablesKeyboard(true);
    EXPECT_THAT(tree.lastEffect(), FailedFor(why));
    EXPECT_EQ(tree.inhibited("input3"), "0");
  }
}

}  // namespace
}  // namespace tavisk

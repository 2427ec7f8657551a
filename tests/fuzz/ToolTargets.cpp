// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <cerrno>

#include "ToolRun.h"
#include "base/Calendar.h"
#include "base/Text.h"
#include "control/SettingValues.h"
#include "control/StatusReader.h"
#include "control/apply/WantedFile.h"
#include "control/undo/UndoPlan.h"
#include "fuzz/Targets.h"
#include "hosts/linux/LinuxHost.h"
#include "hosts/scratch/KeyTable.h"
#include "hosts/scratch/Misspellings.h"

namespace tavisk::fuzz {
namespace {

/// Its clock stands still, and it knows few zones.
constexpr const char* smallMachine =
    "<dict><key>Clock</key><dict><key>Time</key><integer>1795000000</integer><key>Known Time Zones</key><array>"
    "<string>UTC</string><string>Europe/Paris</string></array></dict></dict>";

/// What a reader of the controller's device would get, one reply after the other, each behind its length.
class FuzzedLink final : public ControllerLink {
 public:
  explicit FuzzedLink(std::string_view bytes) : _rest(bytes) {}
  Result<void> open() override { return {}; }
  Result<std::vector<std::uint8_t>> exchange(const ControllerRequest& /*request*/) override {
    if (_rest.empty()) return systemFailure("open", managementController, ETIMEDOUT);
    const auto length = static_cast<std::uint8_t>(_rest.front()) % 32U;
    const auto reply = _rest.substr(1, length);
    _rest.remove_prefix(1 + reply.size());
    return std::vector<std::uint8_t>(reply.begin(), reply.end());
  }

 private:
  std::string_view _rest;
};

}  // namespace

void machinePropertyList(std::string_view bytes) {
  const auto list = parsePropertyList(bytes, foreignFileLimits);
  const auto* described = list ? list->asDictionary() : nullptr;
  if (!described) return;
  const auto wrong = whyWrong(*described);
  if (!wrong)
    for (const auto& name : misspeltNames(*described)) hold(!name.empty(), "a misspelt name is told");
  ScratchMachine machine;
  machine.describe(bytes);
  const auto opened = ScratchHost::open(machine.directory(), machine.effects, machine.runLoop);
  if (!isDone(opened)) return;
  hold(!wrong, "only a sound machine is opened");
  const auto limit = machine.runLoop.limitWaits(std::chrono::milliseconds(20));
  holdSettings(**opened, machine.effects, machine.runLoop, true);
}

/// Words that are typed at the prompt, and what it asks in between: a question goes on until it has an answer.
void prompt(std::string_view bytes) {
  constexpr int mostQuestions = 150;  // of a line
  auto typed = std::string(bytes) + "\n";
  for (int i = 0; i < mostQuestions; ++i) typed += "no\n";
  typed += "quit\n";
  ScratchMachine machine;
  machine.describe(smallMachine);
  const auto result = runTool(machine, {}, {.typed = typed, .longestCommand = std::chrono::milliseconds(20)});
  hold(result.status == 0 || result.status == 1, "a run ends with 0 or 1");
  hold(result.output.starts_with("> tavisk\n"), "the prompt greets");
}

/// A date that is taken is the machine's date then, and a time its time.
void dateAndTimeWords(std::string_view bytes) {
  if (bytes.find('\0') != std::string_view::npos) return;
  ScratchMachine machine;
  machine.describe(smallMachine);
  const std::string text(bytes);
  setDefaultTimeZone("");
  const auto date = runTool(machine, {"-setdate", text, "-getdate"}).output;
  DateTime typed;
  if (std::sscanf(date.c_str(), "setdate: %ld/%ld/%ld\n", &typed.month, &typed.day, &typed.year) == 3) {
    const auto meant = localDateTime(static_cast<std::int64_t>(secondsSince1970(typed)));
    hold(date.ends_with("Date: " + std::to_string(meant.month) + "/" + std::to_string(meant.day) + "/" +
                        std::to_string(meant.year) + "\n"),
         "a date that is taken is the date");
  }
  const auto time = runTool(machine, {"-settime", text, "-gettime"}).output;
  const auto taken = time.substr(0, time.find('\n'));
  if (taken.starts_with("Set Time: ") && !taken.starts_with("Set Time: 24"))
    hold(time == taken + "\n" + taken.substr(taken.find("Time")) + "\n", "a time that is taken is the time");
}

void wantedFile(std::string_view bytes) {
  const auto wanted = control::wantedIn(bytes, "a file");
  if (!isDone(wanted)) return;
  for (const auto& [setting, value] : *wanted) {
    hold(setting && control::managedNamed(setting->name) == setting, "a setting is wanted");
    hold(control::isSameValue(*setting, value, value), "a value is itself");
    look(control::setterWords(*setting, value));
    const auto same = control::valueMeantBy(*setting, value);
    hold(!same || control::isSameValue(*setting, *same, value) || setting->kind == control::ValueKind::startupDelay,
         "a value means itself");
  }
}

void effectsLog(std::string_view bytes) {
  static Tree folder;
  folder.renew({{EffectsLog::path, std::string(bytes)}});
  const auto found = ScratchChangeHistory(folder.root).changes();
  hold(found && found->changes.size() <= 1 + static_cast<std::size_t>(std::ranges::count(bytes, '\n')),
       "a line a change");
  const auto chosen =
      control::chosenChanges(found->changes, bytes.size() % 2 == 0 ? std::optional<std::int64_t>(5) : std::nullopt);
  std::vector<control::SettingState> states;
  for (const auto* setting : control::settingsOf(chosen))
    states.push_back({{.setting = std::string(setting->name), .live = chosen.front().after}, {}});
  for (const auto& plan : control::planUndo(chosen, states, {true, true})) {
    hold(plan.step != control::UndoStep::set || (plan.managed && plan.back), "what is set has a value");
    if (plan.step == control::UndoStep::set) look(control::setterWords(*plan.managed, *plan.back));
  }
}

void controllerReplies(std::string_view bytes) {
  static Tree machine;
  machine.renew({{"/sys/class/ipmi/ipmi0/device/type", "kcs\n"}, {"/etc/tavisk/startup-delay.conf", partOf(bytes, 1)}});
  EffectSink effects;
  RunLoop runLoop;
  ServiceAccess services(machine.root, runLoop);
  FuzzedLink link(bytes.substr(0, bytes.find("\n--\n")));
  ManagementController controller(link);
  const LinuxMachine whole{machine.root, effects, runLoop, services};
  if (const auto maker = controller.manufacturer()) hold(*maker <= 0xFFFFF, "a manufacturer has a number");
  FirstConsole console(machine.root);
  KernelNetworkCards cards(machine.root);
  LinuxPowerSettingsService settings(whole, {console, cards, controller});
  if (settings.supports(PowerSwitch::restartAfterPowerFailure, {}))
    settings.setOn(PowerSwitch::restartAfterPowerFailure, {},
                   !settings.isOn(PowerSwitch::restartAfterPowerFailure, {}));
  LinuxPowerController power(whole, controller);
  const auto service = power.serviceOfClass("VelmarKCS");
  hold(service.has_value(), "the controller is there");
  if (const auto units = power.numberProperty(service, "ServerID")) hold(*units >= 0, "a delay is not below 0");
  PropertyList::Dictionary properties;
  properties.set("ServerID", PropertyList::Data{4});
  look(power.setProperties(power.open(service, 0).second, properties, 4));
}

}  // namespace tavisk::fuzz

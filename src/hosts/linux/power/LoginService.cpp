// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/LoginService.h"

#include <algorithm>
#include <csignal>

#include "effects/SettingNames.h"
#include "hosts/linux/power/PowerValues.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/TimeSpan.h"

namespace tavisk {
namespace {

constexpr const char* service = "org.freedesktop.login1";
constexpr Daemon loginDaemon{"systemd-logind.service", "", "systemd-logind"};
/// What the service starts to let the machine sleep.
constexpr Daemon sleepTarget{"suspend.target", "", ""};
constexpr const char* section = "Login";
constexpr const char* never = "0";
constexpr std::chrono::milliseconds betweenQuestions{20};

BusObject loginManager() {
  return {service, "/org/freedesktop/login1", "org.freedesktop.login1.Manager"};
}

bool isSleep(const std::string& action) {
  constexpr std::string_view words[] = {"sleep", "suspend", "hibernate", "hybrid-sleep", "suspend-then-hibernate"};
  return std::ranges::find(words, action) != std::end(words);
}

bool hasPowerButton(const SystemRoot& root) {
  for (const auto& device : root.list("/sys/bus/acpi/devices").valueOr({}))
    if (device.starts_with("LNXPWRBN") || device.starts_with("PNP0C0C")) return true;
  for (const auto& device : root.list("/sys/class/input").valueOr({}))
    if (readKernelFile(root, "/sys/class/input/" + device + "/name").valueOr("") == "Power Button") return true;
  return false;
}

}  // namespace

Result<BusMessage> LoginService::property(const char* name, const char* signature) {
  auto bus = _machine.services.systemBus();
  if (!bus) return bus.failure();
  return (*bus)->property(loginManager(), name, signature);
}

Result<LoginService::Value> LoginService::liveSleep() {
  // Without the service nothing lets an idle machine sleep.
  if (!_machine.services.hasServiceManager()) return Value(never);
  auto action = property("IdleAction", "s");
  if (!action) return action.failure();
  if (!isSleep(std::move(action).value().readText())) return Value(never);
  auto time = property("IdleActionUSec", "t");
  if (!time) return time.failure();
  return Value(wholeMinutes(std::chrono::microseconds(std::move(time).value().readUint64())));
}

Result<LoginService::Value> LoginService::liveButton() {
  auto action = property("HandlePowerKey", "s");
  if (!action) return action.failure();
  return Value(onOff(isSleep(std::move(action).value().readText())));
}

LoginService::Value LoginService::storedSleep() const {
  constexpr std::chrono::minutes withoutOne{30};
  const auto action = _config.last(section, "IdleAction");
  if (!action || !isSleep(action->value)) return never;
  const auto time = _config.last(section, "IdleActionSec");
  return wholeMinutes(time ? timeSpan(time->value).value_or(withoutOne) : withoutOne);
}

LoginService::Value LoginService::storedButton() const {
  const auto action = _config.last(section, "HandlePowerKey");
  return onOff(action && isSleep(action->value));
}

std::optional<Failure> LoginService::whyCannotSleep() {
  constexpr const char* tried = "CanSuspend";
  if (!_machine.services.hasServiceManager()) return Failure{tried, service, "this machine has no login service"};
  auto bus = _machine.services.systemBus();
  if (!bus) return bus.failure();
  auto answer = (*bus)->query(loginManager(), tried, "s");
  // A service that does not answer is no reason: whatever is done with it then tells why.
  if (!answer)
    return answer.failure().code == BusErrorCode::serviceUnknown ? std::optional(answer.failure()) : std::nullopt;
  if (std::move(answer).value().readText() == "na") return Failure{tried, service, "this machine cannot sleep"};
  // The service would take the setting and refuse to act by it.
  const auto presence = _machine.services.daemons().presence(sleepTarget);
  if (!presence || *presence != Daemons::Presence::masked) return std::nullopt;
  return Failure{tried, sleepTarget.unit, "it is masked: this machine is kept from sleeping"};
}

std::optional<Failure> LoginService::whyNoButton() {
  if (!hasPowerButton(_machine.root)) return Failure{"find", "/sys/class/input", "this machine has no power button"};
  return whyCannotSleep();
}

/// Programs that keep the machine from sleeping as long as they run.
std::string LoginService::whatBlocksSleep() {
  std::string names;
  auto bus = _machine.services.systemBus();
  if (!bus) return names;
  auto reply = (*bus)->query(loginManager(), "ListInhibitors", "a(ssssuu)");
  if (!reply) return names;
  auto inhibitors = std::move(reply).value();
  if (!inhibitors.enter('a', "(ssssuu)")) return names;
  while (inhibitors.enter('r', "ssssuu")) {
    const auto what = inhibitors.readText();
    const auto who = inhibitors.readText();
    inhibitors.readText();
    const auto mode = inhibitors.readText();
    inhibitors.readUint32();
    inhibitors.readUint32();
    inhibitors.exit();
    const bool blocks = what.find("sleep") != std::string::npos || what.find("idle") != std::string::npos;
    if (mode == "block" && blocks) names += (names.empty() ? "" : ", ") + who;
  }
  return names;
}

Result<void> LoginService::store(const std::map<std::string, std::string>& values) {
  if (auto failure = whyNeedsRoot("write", _config.ownDropIn())) return *failure;
  return _config.setOwn(section, values);
}

/// The service looks at the time only when it starts: with its configuration read again it would tell the new value and
/// go on by the old one. When it starts it takes a machine without users for idle since it was turned on, and would let
/// it sleep at once, unless it is told that the machine is busy. Sessions live on.
Result<void> LoginService::restartService(const std::string& minutes) {
  auto bus = _machine.services.systemBus();
  if (!bus) return bus.failure();
  // The reply holds the lock.
  const auto busy = (*bus)->call(loginManager(), "Inhibit", "h", "idle", "tavisk", "sets the time of sleep", "block");
  if (!busy) return busy.failure();
  auto restarted = _machine.services.daemons().restart(loginDaemon);
  // An answer with the new value proves that it has started and looked at the time, however long its job takes.
  const auto sleep = liveSleep();
  if (!restarted && sleep && *sleep == minutes) return {};
  return restarted && !sleep ? sleep.failure() : restarted;
}

Result<void> LoginService::rereadConfiguration() {
  auto bus = _machine.services.systemBus();
  if (!bus) return bus.failure();
  const BusObject manager{"org.freedesktop.systemd1", "/org/freedesktop/systemd1", "org.freedesktop.systemd1.Manager"};
  auto done = (*bus)->call(manager, "KillUnit", "", loginDaemon.unit, "main", std::int32_t{SIGHUP});
  if (!done) return Failure{"KillUnit", loginDaemon.unit, done.failure().why};
  return {};
}

/// No signal of the bus tells that the service has read its configuration.
std::function<bool(const std::string&)> LoginService::onceItReads(Setting<std::string>::Read live) {
  auto questions = std::make_shared<RunLoop::Registration>(_machine.runLoop.every(betweenQuestions, [] {}));
  return [live = std::move(live), questions](const std::string& asked) {
    const auto found = live();
    return found && *found && (*found)->value == asked;
  };
}

Setting<std::string> LoginService::computerSleep() {
  Setting<std::string> setting;
  setting.name = setting::computerSleep;
  setting.unit = "minutes";
  setting.live = [this] { return liveSleep(); };
  setting.stored = [this] { return storedSleep(); };
  return setting;
}

Setting<std::string> LoginService::computerSleepChange(const std::string& minutes) {
  auto setting = computerSleep();
  setting.where = _config.ownDropIn();
  setting.undoneBy = [this](const auto&) {
    const auto file = _config.whatHides(section, {"IdleAction", "IdleActionSec"});
    return file.empty() ? whatBlocksSleep() : file;
  };
  if (minutes != never)
    setting.note = saying("a machine on which nobody is logged in counts as idle, however busy its services are");
  setting.supported = [this] { return whyCannotSleep(); };
  setting.store = [this](const std::string& asked) {
    if (asked == never) return store({{"IdleAction", "ignore"}});
    return store({{"IdleAction", "suspend"}, {"IdleActionSec", asked + "min"}});
  };
  setting.apply = [this](const std::string& asked) { return restartService(asked); };
  return setting;
}

Setting<std::string> LoginService::powerButtonSleep() {
  Setting<std::string> setting;
  setting.name = setting::powerButtonSleep;
  setting.supported = [this] { return whyNoButton(); };
  setting.live = [this] { return liveButton(); };
  setting.stored = [this] { return storedButton(); };
  return setting;
}

Setting<std::string> LoginService::powerButtonSleepChange() {
  auto setting = powerButtonSleep();
  setting.where = _config.ownDropIn();
  setting.undoneBy = [this](const auto&) { return _config.whatHides(section, {"HandlePowerKey"}); };
  setting.store = [this](const std::string& value) {
    return store({{"HandlePowerKey", isOn(value) ? "suspend" : "poweroff"}});
  };
  setting.apply = [this](const std::string&) { return rereadConfiguration(); };
  setting.settled = onceItReads(setting.live);
  return setting;
}

}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/ComputerSleep.h"

#include <algorithm>
#include <csignal>
#include <memory>

#include "base/TimeSpan.h"
#include "effects/SettingNames.h"
#include "effects/Warning.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr Daemon loginDaemon{"systemd-logind.service", "", "systemd-logind"};
/// What the service starts to let the machine sleep.
constexpr Daemon sleepTarget{"suspend.target", "", ""};
constexpr const char* inputs = "/sys/class/input";
constexpr const char* loginSection = "Login";
constexpr const char* action = "IdleAction";
constexpr const char* actionTime = "IdleActionSec";
constexpr const char* powerKey = "HandlePowerKey";
constexpr std::chrono::milliseconds betweenQuestions{20};
constexpr std::chrono::seconds longestRestart{3};
constexpr std::optional<std::chrono::microseconds> withoutTime = std::chrono::minutes(30);

bool isSleep(const std::string& word) {
  constexpr std::string_view words[] = {"sleep", "suspend", "hibernate", "hybrid-sleep", "suspend-then-hibernate"};
  return std::ranges::find(words, word) != std::end(words);
}

/// Absent when it is no length of time.
std::optional<Minutes> minutesIn(const std::string& time) {
  const auto span = time.empty() ? withoutTime : timeSpan(time);
  if (!span) return std::nullopt;
  return *span == endlessTime ? Minutes{} : Minutes::covering(*span);
}

Result<Minutes> minutesOf(const std::string& word, const SystemdConfig::Assignment& time) {
  if (!isSleep(word)) return Minutes{};
  const auto minutes = minutesIn(time.value);
  if (!minutes) return Failure{"read " + std::string(actionTime), time.file, "no length of time: " + time.value};
  return *minutes;
}

/// Whether the service was not there, or has gone away before it could answer (sd_bus_error_get_errno(3)): the errors
/// NameHasNoOwner, Disconnected, NoReply. One that is only slow has the last code too, and is not asked twice by the
/// bus.
bool isAway(const Failure& failure) {
  return failure.code == std::errc::no_such_device_or_address || failure.code == std::errc::connection_reset ||
         failure.code == std::errc::timed_out;
}

Result<bool> hasPowerButton(const SystemRoot& root) {
  const auto isButton = [](const std::string& device) {
    return device.starts_with("LNXPWRBN") || device.starts_with("PNP0C0C");
  };
  const auto devices = orEmpty(root.list("/sys/bus/acpi/devices"));
  if (!devices) return devices.failure();
  if (std::ranges::any_of(*devices, isButton)) return true;
  const auto names = ofEachIn(
      root, inputs, [&](const auto& input) { return orGone(readKernelFile(root, inputs + ("/" + input) + "/name")); });
  if (!names) return names.failure();
  return std::ranges::find(*names, "Power Button") != names->end();
}

}  // namespace

Result<BusMessage> ComputerSleep::ask(const Question& question) {
  const auto askOnce = [&]() -> Result<BusMessage> {
    const auto bus = _machine.services.systemBus();
    return bus ? question(**bus) : bus.failure();
  };
  auto answer = askOnce();
  if (answer || !isAway(answer.failure())) return answer;
  const auto first = answer.failure();
  const auto questions = _machine.runLoop.every(betweenQuestions, [] {});
  const auto isBack = [&] {
    answer = askOnce();
    return answer || !isAway(answer.failure());
  };
  static_cast<void>(_machine.runLoop.runUntil(RunLoop::Clock::now() + longestRestart, isBack));
  if (!answer && isAway(answer.failure())) return first;
  return answer;
}

Result<BusMessage> ComputerSleep::property(const char* name, const char* signature) {
  return ask([=](Bus& bus) { return bus.property(loginManager(), name, signature); });
}

Result<Minutes> ComputerSleep::liveMinutes() {
  // Without the service nothing lets an idle machine sleep.
  if (!_machine.services.hasServiceManager()) return Minutes{};
  auto word = property(action, "s");
  if (!word) return word.failure();
  if (!isSleep(std::move(word).value().readText())) return Minutes{};
  auto time = property("IdleActionUSec", "t");
  if (!time) return time.failure();
  return Minutes::covering(std::chrono::microseconds(std::move(time).value().readUint64()));
}

Result<bool> ComputerSleep::liveButton() {
  auto word = property(powerKey, "s");
  if (!word) return word.failure();
  return isSleep(std::move(word).value().readText());
}

Result<Minutes> ComputerSleep::storedMinutes() const {
  const auto word = _config.last(loginSection, action);
  if (!word) return word.failure();
  const auto time = _config.last(loginSection, actionTime);
  if (!time) return time.failure();
  return minutesOf(*word ? (*word)->value : "", time->value_or(SystemdConfig::Assignment{}));
}

Result<std::optional<Minutes>> ComputerSleep::ownMinutes() const {
  const auto word = _config.own(loginSection, action);
  if (!word) return word.failure();
  const auto time = _config.own(loginSection, actionTime);
  if (!time) return time.failure();
  if (!*word) return std::nullopt;
  const auto minutes = minutesOf(**word, {_ownFile.path(), time->value_or("")});
  if (!minutes) return minutes.failure();
  return std::optional(*minutes);
}

Result<bool> ComputerSleep::storedButton() const {
  const auto word = _config.last(loginSection, powerKey);
  if (!word) return word.failure();
  return *word && isSleep((*word)->value);
}

Result<std::optional<bool>> ComputerSleep::ownButton() const {
  const auto word = _config.own(loginSection, powerKey);
  if (!word) return word.failure();
  return *word ? std::optional(isSleep(**word)) : std::nullopt;
}

Support ComputerSleep::sleepSupported() {
  constexpr const char* tried = "CanSuspend";
  if (!_machine.services.hasServiceManager())
    return NotSupported{{tried, loginManager().service, "this machine has no login service"}};
  const auto bus = _machine.services.systemBus();
  if (!bus && isAbsent(bus.failure())) return NotSupported{bus.failure()};
  if (!bus) return bus.failure();
  auto answer = ask([](Bus& asked) { return asked.call(loginManager(), tried, "s"); });
  // Since version 257 that is what the service says where the kernel has no files for it, as in containers.
  const bool hasNoFiles = !answer && answer.failure().code == BusErrorCode::fileNotFound;
  if (!answer && !hasNoFiles) return supportWithoutAnswer(answer.failure());
  if (hasNoFiles || std::move(answer).value().readText() == "na")
    return NotSupported{{tried, loginManager().service, "this machine cannot sleep"}};
  // The service would take the setting and refuse to act by it.
  const auto presence = _machine.services.daemons().presence(sleepTarget);
  if (!presence) return presence.failure();
  if (*presence != Daemons::Presence::masked) return std::nullopt;
  return NotSupported{{tried, sleepTarget.unit, "it is masked: this machine is kept from sleeping"}};
}

/// A service that is masked never comes, which is asked only when it has not answered: it may run still.
Support ComputerSleep::supportWithoutAnswer(const Failure& failure) {
  if (failure.code == BusErrorCode::serviceUnknown) return NotSupported{failure};
  const auto presence = _machine.services.daemons().presence(loginDaemon);
  if (!presence || *presence != Daemons::Presence::masked) return failure;
  return NotSupported{{failure.tried, loginDaemon.unit, "it is masked: nothing lets this machine sleep"}};
}

Support ComputerSleep::buttonSupported() {
  const auto hasOne = hasPowerButton(_machine.root);
  if (!hasOne) return hasOne.failure();
  return *hasOne ? sleepSupported() : NotSupported{{"find", inputs, "this machine has no power button"}};
}

/// Programs that keep the machine from sleeping as long as they run.
std::string ComputerSleep::whatBlocksSleep() {
  std::string names;
  const auto bus = _machine.services.systemBus();
  if (!bus) return names;
  auto reply = (*bus)->call(loginManager(), "ListInhibitors", "a(ssssuu)");
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
    const bool isAboutSleep = what.find("sleep") != std::string::npos || what.find("idle") != std::string::npos;
    if (mode == "block" && isAboutSleep) names += (names.empty() ? "" : ", ") + who;
  }
  return names;
}

std::string ComputerSleep::whatHidesMinutes(Minutes asked) const {
  const auto isAction = [asked](const std::string& word) { return isSleep(word) != asked.isNever(); };
  auto file = _config.whatHides(loginSection, action, isAction).valueOr("");
  if (!file.empty() || asked.isNever()) return file;
  return _config.whatHides(loginSection, actionTime, [asked](const auto& time) { return minutesIn(time) == asked; })
      .valueOr("");
}

std::string ComputerSleep::whatHidesButton(bool sleeps) const {
  return _config.whatHides(loginSection, powerKey, [sleeps](const auto& word) { return isSleep(word) == sleeps; })
      .valueOr("");
}

Result<void> ComputerSleep::store(const std::map<std::string, std::string>& values,
                                  const std::function<Result<bool>()>& isHeeded,
                                  const std::function<std::string()>& hidingFile) {
  return _ownFile.changeIfHeeded(
      {.write = [&] { return _config.setOwn(loginSection, values); }, .isHeeded = isHeeded, .hidingFile = hidingFile});
}

OwnPart ComputerSleep::ownPart(const std::vector<std::string>& keys) const {
  const auto takeAway = [this, keys](WrittenPlaces& taken) {
    return _ownFile.notingChange(taken, [&] { return _config.removeOwn(loginSection, keys); });
  };
  return {.isThere = [this, keys] { return _config.hasOwn(loginSection, keys); },
          .check = [this] { return _ownFile.check(); },
          .takeAway = takeAway};
}

Result<void> ComputerSleep::storeMinutes(Minutes asked) {
  const auto isHeeded = [&]() -> Result<bool> {
    const auto minutes = storedMinutes();
    if (!minutes) return minutes.failure();
    return *minutes == asked;
  };
  const auto hidingFile = [&] { return whatHidesMinutes(asked); };
  if (asked.isNever()) return store({{action, "ignore"}}, isHeeded, hidingFile);
  return store({{action, "suspend"}, {actionTime, textOf(asked) + "min"}}, isHeeded, hidingFile);
}

Result<void> ComputerSleep::storeButton(bool sleeps) {
  const auto isHeeded = [&]() -> Result<bool> {
    const auto sleepsThen = storedButton();
    if (!sleepsThen) return sleepsThen.failure();
    return *sleepsThen == sleeps;
  };
  return store({{powerKey, sleeps ? "suspend" : "poweroff"}}, isHeeded, [&] { return whatHidesButton(sleeps); });
}

std::string ComputerSleep::whoUndoesMinutes(Minutes asked) {
  const auto file = whatHidesMinutes(asked);
  return file.empty() && !asked.isNever() ? whatBlocksSleep() : file;
}

/// The service looks at the time only when it starts: with its configuration read again it would tell the new value and
/// go on by the old one. When it starts it takes a machine without users for idle since it was turned on, and would let
/// it sleep at once, unless it is told that the machine is busy. Sessions live on.
Result<void> ComputerSleep::restartService(Minutes asked) {
  // The reply holds the lock.
  const auto busy = ask([](Bus& bus) {
    return bus.call(loginManager(), "Inhibit", "h", "idle", "tavisk", "sets the time of sleep", "block");
  });
  if (!busy) return busy.failure();
  const auto restarted = _machine.services.daemons().restart(loginDaemon);
  // An answer with the new value proves that it has started and looked at the time, however long its job takes.
  const auto minutes = liveMinutes();
  if (!restarted && minutes && *minutes == asked) return {};
  return restarted && !minutes ? minutes.failure() : restarted;
}

/// A service that only reads its configuration again would also tell a time that was stored and not yet taken up.
Result<void> ComputerSleep::applyButton() {
  const auto minutes = storedMinutes();
  if (!minutes) return minutes.failure();
  const auto live = liveMinutes();
  if (!live) return live.failure();
  return *minutes == *live ? rereadConfiguration() : restartService(*minutes);
}

Result<void> ComputerSleep::rereadConfiguration() {
  const auto bus = _machine.services.systemBus();
  if (!bus) return bus.failure();
  const auto done = (*bus)->call(serviceManager(), "KillUnit", "", loginDaemon.unit, "main", std::int32_t{SIGHUP});
  return done ? Result<void>() : retold(done.failure(), "KillUnit", loginDaemon.unit);
}

/// No signal of the bus tells that the service has read its configuration: it is asked again and again.
std::function<bool(bool)> ComputerSleep::onceButtonReads() {
  return [this, questions = std::shared_ptr<RunLoop::Registration>()](bool asked) mutable {
    if (!questions)
      questions = std::make_shared<RunLoop::Registration>(_machine.runLoop.every(betweenQuestions, [] {}));
    const auto found = liveButton();
    return found && *found == asked;
  };
}

Setting<Minutes> ComputerSleep::computerSleep() {
  Setting<Minutes> setting;
  setting.name = setting::computerSleep;
  setting.unit = "minutes";
  setting.undoneBy = [this](Minutes asked) { return whoUndoesMinutes(asked); };
  setting.note = [](Minutes asked) -> std::string {
    if (asked.isNever()) return "";
    return warning("a machine on which nobody is logged in counts as idle, however busy its services are");
  };
  setting.supported = [this] { return sleepSupported(); };
  setting.live = [this] { return liveMinutes(); };
  setting.stored = [this] { return besideOwn(storedMinutes(), ownMinutes(), _ownFile.path()); };
  setting.check = [this](Minutes asked) { return _ownFile.check(whatHidesMinutes(asked)); };
  setting.own = ownPart({action, actionTime});
  keepIn(_ownFile, setting, [this](Minutes asked) { return storeMinutes(asked); });
  setting.apply = [this](Minutes asked) { return restartService(asked); };
  return setting;
}

Setting<bool> ComputerSleep::powerButtonSleep() {
  Setting<bool> setting;
  setting.name = setting::powerButtonSleep;
  setting.undoneBy = [this](bool sleeps) { return whatHidesButton(sleeps); };
  setting.supported = [this] { return buttonSupported(); };
  setting.live = [this] { return liveButton(); };
  setting.stored = [this] { return besideOwn(storedButton(), ownButton(), _ownFile.path()); };
  setting.check = [this](bool sleeps) { return _ownFile.check(whatHidesButton(sleeps)); };
  setting.own = ownPart({powerKey});
  keepIn(_ownFile, setting, [this](bool sleeps) { return storeButton(sleeps); });
  setting.apply = [this](bool) { return applyButton(); };
  setting.settled = onceButtonReads();
  return setting;
}

}  // namespace tavisk

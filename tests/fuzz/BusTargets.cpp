// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <systemd/sd-bus.h>

#include <array>
#include <iterator>

#include "base/Text.h"
#include "fuzz/Targets.h"
#include "hosts/linux/BusPeer.h"
#include "hosts/linux/LinuxHost.h"
#include "hosts/linux/access/Polkit.h"

namespace tavisk::fuzz {
namespace {

/// What services answer, value by value, for as long as there are bytes; then they have gone away.
class Answers {
 public:
  void begin(std::string_view bytes) { _rest = bytes; }
  bool isOver() const { return _rest.empty(); }
  std::uint8_t byte() {
    const auto first = _rest.substr(0, 1);
    _rest.remove_prefix(first.size());
    return first.empty() ? std::uint8_t{0} : static_cast<std::uint8_t>(first.front());
  }
  std::string text() {
    constexpr const char* known[] = {"enabled", "disabled",  "active",  "done",
                                     "loaded",  "not-found", "suspend", "enabled-runtime",
                                     "sleep",   "block",     "symlink", "/org/freedesktop/j/1"};
    const auto kind = byte();
    if (kind < std::size(known)) return known[kind];
    std::string text(_rest.substr(0, kind % 32U));
    _rest.remove_prefix(text.size());
    std::erase(text, '\0');
    return isUtf8(text) ? text : "?";
  }
  std::uint64_t number() {
    std::uint64_t number = 0;
    for (auto length = byte() % 9U; length > 0; --length) number = number << 8U | byte();
    return number;
  }
  /// Puts values of all these types into a message.
  void fill(sd_bus_message* message, std::string_view types) {
    while (!types.empty()) fillFirst(message, types);
  }

 private:
  void fillContainer(sd_bus_message* message, char kind, std::string_view inner, std::size_t count = 1) {
    sd_bus_message_open_container(message, kind, std::string(inner).c_str());
    for (; count > 0; --count) fill(message, inner);
    sd_bus_message_close_container(message);
  }

  void fillFirst(sd_bus_message* message, std::string_view& types) {
    constexpr std::array variants = {"s", "b", "t", "as", "a(sbbsi)", "i", "o"};
    const char kind = types[0];
    const bool isArray = kind == 'a';
    const auto opens = types.substr(isArray ? 1 : 0, 1);
    const auto length = opens == "(" || opens == "{" ? types.rfind(opens == "(" ? ')' : '}') + 1 : isArray ? 2U : 1U;
    const auto type = types.substr(0, length);
    types.remove_prefix(length);
    if (isArray) return fillContainer(message, 'a', type.substr(1), byte() % 4U);
    if (kind == '(') return fillContainer(message, 'r', type.substr(1, length - 2));
    if (kind == '{') return fillContainer(message, 'e', type.substr(1, length - 2));
    if (kind == 'v') return fillContainer(message, 'v', variants.at(byte() % variants.size()));
    fillBasic(message, kind);
  }

  void fillBasic(sd_bus_message* message, char type) {
    static const FileDescriptor file(::eventfd(0, EFD_CLOEXEC));
    if (type == 's' || type == 'o') {
      if (sd_bus_message_append_basic(message, type, text().c_str()) < 0)
        sd_bus_message_append_basic(message, type, "/");
      return;
    }
    const std::uint64_t number = type == 'h' ? static_cast<std::uint64_t>(file.number()) : this->number();
    const auto small = static_cast<std::uint32_t>(type == 'b' ? number & 1U : number);
    sd_bus_message_append_basic(message, type, type == 't' ? static_cast<const void*>(&number) : &small);
  }

  std::string_view _rest;
};

Answers answers;
sd_bus_message_handler_t signalHandler = nullptr;
void* signalReceiver = nullptr;

sd_bus_message* newMessage(sd_bus* bus) {
  sd_bus_message* message = nullptr;
  sd_bus_message_new_method_call(bus, &message, nullptr, "/", "a.b", "c");
  return message;
}

int call(sd_bus* bus, sd_bus_message* /*request*/, std::uint64_t /*longest*/, sd_bus_error* error,
         sd_bus_message** reply) {
  constexpr std::array errors = {"org.freedesktop.DBus.Error.ServiceUnknown", "org.freedesktop.DBus.Error.FileNotFound",
                                 "org.freedesktop.DBus.Error.AccessDenied", "x.y.Unknown"};
  const auto kind = answers.isOver() ? 1 : answers.byte();
  if (kind == 1) return -ECONNRESET;
  if (kind == 2) return sd_bus_error_set(error, errors.at(answers.byte() % errors.size()), answers.text().c_str());
  *reply = newMessage(bus);
  return 1;
}

/// The reply is made when it is known what it is to be; some are of other types.
int hasSignature(sd_bus_message* message, const char* signature) {
  const bool isOther = answers.byte() == 1;
  answers.fill(message, isOther ? "u" : signature);
  sd_bus_message_seal(message, 1, 0);
  sd_bus_message_rewind(message, 1);
  return isOther ? 0 : 1;
}

int matchSignal(sd_bus* /*bus*/, sd_bus_slot** /*slot*/, const char* /*sender*/, const char* /*path*/,
                const char* /*interface*/, const char* /*member*/, sd_bus_message_handler_t handler, void* receiver) {
  signalHandler = handler;
  signalReceiver = receiver;
  return 0;
}

sd_bus_slot* forgetSignal(sd_bus_slot* /*slot*/) {
  signalHandler = nullptr;
  return nullptr;
}

int process(sd_bus* bus, sd_bus_message** /*message*/) {
  if (!signalHandler || answers.isOver()) return 0;
  auto* signal = newMessage(bus);
  answers.fill(signal, answers.byte() % 4U == 0 ? "i" : "uoss");
  sd_bus_message_seal(signal, 1, 0);
  sd_bus_message_rewind(signal, 1);
  signalHandler(signal, signalReceiver, nullptr);
  sd_bus_message_unref(signal);
  return 1;
}

/// The library as it is, but for what goes over the connection.
Result<SystemdLibrary> openFuzzedLibrary() {
  auto library = openSystemdLibrary();
  if (!library) return library;
  auto fuzzed = *library;
  fuzzed.sd_bus_is_ready = [](sd_bus*) { return 1; };
  fuzzed.sd_bus_is_open = [](sd_bus*) { return answers.isOver() ? 0 : 1; };
  fuzzed.sd_bus_wait = [](sd_bus*, std::uint64_t) { return 0; };
  fuzzed.sd_bus_get_unique_name = [](sd_bus*, const char** name) { return *name = ":1.7", 0; };
  fuzzed.sd_bus_call = call;
  fuzzed.sd_bus_message_has_signature = hasSignature;
  fuzzed.sd_bus_match_signal = matchSignal;
  fuzzed.sd_bus_slot_unref = forgetSignal;
  fuzzed.sd_bus_process = process;
  return fuzzed;
}

/// A machine of which only the bus tells something.
struct BusMachine {
  BusMachine() {
    for (const auto* folder : {"/run/systemd/system", "/etc/systemd", "/proc/sys/kernel", "/dev"})
      tree.makeFolder(folder);
    tree.put("/etc/hosts", "127.0.1.1 old\n");
    tree.put("/proc/sys/kernel/hostname", "old\n");
    tree.makeFolder("/run/dbus");
    listener = socketAt(tree.at("/run/dbus/system_bus_socket"), SOCK_STREAM);
    hold(::listen(listener.number(), 8) == 0, "there is a bus");
  }

  Tree tree;
  FileDescriptor listener;
};

void useDaemons(Daemons& daemons) {
  const Daemon ssh{"ssh.service", "ssh", "sshd"};
  WrittenPlaces written;
  look(daemons.presences({ssh, ssh}));
  for (const auto ask : {&Daemons::isRunning, &Daemons::isChanging, &Daemons::startsAtBoot,
                         &Daemons::startsUntilRestart, &Daemons::staysOffAtBoot})
    look((daemons.*ask)(ssh));
  for (const bool starts : {true, false}) look(daemons.setStartAtBoot({ssh, ssh}, starts, written));
  for (const auto act : {&Daemons::foreseeStart, &Daemons::start, &Daemons::restart, &Daemons::restartIfRunning})
    look((daemons.*act)(ssh));
}

void useAuthorization(ServiceAccess& services) {
  const auto bus = services.systemBus();
  if (!isDone(bus)) return;
  const auto answer = checkAuthorization(**bus, "a.b", [] { return Result<void>(); });
  if (!isDone(answer)) return;
  hold(!answer->isGranted || !answer->wasAsked, "what is granted needs no question more");
  look(revokeAuthorization(**bus, answer->temporaryId));
}

void useNames(const LinuxMachine& machine) {
  LinuxHostConfigService(machine).setComputerName("new");
  LinuxHostConfigService(machine).setLocalNetworkName("new");
  const auto session = LinuxDynamicStore(machine).open("");
  look(session->computerName());
  look(session->localHostName());
}

void useTime(const LinuxMachine& machine) {
  look(LinuxClockService(machine).timeZone());
  LinuxNetworkTimeService time(machine);
  look(time.server());
  time.setServer({"time.example"});
  time.start();
  for (const auto& daemon : timeDaemons()) {
    look(serverInUse(daemon, machine));
    look(sourceInUse(daemon, machine));
  }
}

void usePower(const LinuxMachine& machine) {
  FirstConsole console(machine.root);
  KernelNetworkCards cards(machine.root);
  IpmiDevice link(machine.root, machine.runLoop);
  ManagementController controller(link);
  LinuxPowerSettingsService power(machine, {console, cards, controller});
  look(power.isOn(PowerSwitch::powerButtonSleep, {}));
  look(power.restartsAfterFreeze());
  power.setUntilSleep(SleepTimer::computer, {}, Minutes{5});
  LinuxProcessTermination termination(machine);
  termination.disable();
  termination.enable();
}

}  // namespace

void busReplies(std::string_view bytes) {
  static BusMachine bus;
  static RunLoop runLoop;
  static ServiceAccess services(bus.tree.root, runLoop, openFuzzedLibrary);
  if (bytes.empty()) return;
  answers.begin(bytes.substr(1));
  EffectSink effects;
  const LinuxMachine machine{bus.tree.root, effects, runLoop, services};
  const auto limit = runLoop.limitWaits(std::chrono::milliseconds(50));
  const auto part = static_cast<std::uint8_t>(bytes.front()) % 6U;
  if (part == 0) useDaemons(services.daemons());
  if (part == 1) useAuthorization(services);
  if (part == 2) useNames(machine);
  if (part == 3) useTime(machine);
  if (part == 4) usePower(machine);
  if (part == 5) LinuxRemoteShellService(machine).setEnabled(true);
}

}  // namespace tavisk::fuzz

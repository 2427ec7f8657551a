// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/socket.h>
#include <systemd/sd-bus.h>

#include <chrono>
#include <cstring>
#include <functional>
#include <map>
#include <memory>
#include <optional>

#include "hosts/linux/BusPeer.h"
#include "hosts/linux/LinuxTree.h"

namespace tavisk {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr auto limit = 200ms;       // of all that a command waits for
constexpr auto tolerance = 1500ms;  // a wait without the limit takes 5 s

/// Both sockets of a machine with services: of the message bus and of the service manager itself.
class Services {
 public:
  virtual ~Services() = default;
};

constexpr const char* sockets[] = {"/run/dbus/system_bus_socket", "/run/systemd/private"};

/// Callers are connected; each is told something that is no greeting, and hung up on. Without it, nobody takes them.
class Strangers final : public Services {
 public:
  Strangers(const LinuxTree& tree, int backlog, const std::optional<std::string>& greeting = {}) {
    for (const auto* path : sockets) {
      const auto& listener = _listeners.emplace_back(socketAt(tree.at(path), SOCK_STREAM));
      if (backlog > 0) ::listen(listener.number(), backlog);
      if (greeting) _threads.emplace_back([number = listener.number(), greeting] { greet(number, *greeting); });
    }
  }
  ~Strangers() override {
    for (const auto& listener : _listeners) ::shutdown(listener.number(), SHUT_RDWR);
    for (auto& thread : _threads) thread.join();
  }

 private:
  static void greet(int listener, const std::string& greeting) {
    while (const FileDescriptor caller{::accept(listener, nullptr, nullptr)})
      ::send(caller.number(), greeting.data(), greeting.size(), MSG_NOSIGNAL);
  }

  std::vector<FileDescriptor> _listeners;
  std::vector<std::thread> _threads;
};

using Answer = std::function<int(sd_bus_message* call, BusPeer& peer)>;

/// Services that answer every call alike.
class Answering final : public Services {
 public:
  Answering(const LinuxTree& tree, const Answer& answer) {
    for (auto& peer : _peers)
      peer = std::make_unique<BusPeer>(tree.at(sockets[&peer - _peers]), std::vector<std::string>(),
                                       [&peer, answer](auto* call, const auto&) { return answer(call, *peer); });
  }

 private:
  std::unique_ptr<BusPeer> _peers[2];
};

using Put = std::function<std::unique_ptr<Services>(const LinuxTree& tree)>;

Put strangers(int backlog, const std::optional<std::string>& greeting = {}) {
  return [=](const LinuxTree& tree) { return std::make_unique<Strangers>(tree, backlog, greeting); };
}

Put answering(const Answer& answer) {
  return [=](const LinuxTree& tree) { return std::make_unique<Answering>(tree, answer); };
}

Put refusing(const std::string& error) {
  return answering([name = "org.freedesktop.DBus.Error." + error](auto* call, auto&) {
    return sd_bus_reply_method_errorf(call, name.c_str(), "as the test wants it");
  });
}

int withTooMuch(sd_bus_message* call, BusPeer& /*peer*/) {
  constexpr std::size_t size = 64U << 20U;
  sd_bus_message* reply = nullptr;
  void* bytes = nullptr;
  sd_bus_message_new_method_return(call, &reply);
  if (sd_bus_message_append_array_space(reply, 'y', size, &bytes) >= 0) std::memset(bytes, 'x', size);
  const int result = sd_bus_send(nullptr, reply, nullptr);
  sd_bus_message_unref(reply);
  return result;
}

const std::map<std::string, Put> faults{
    {"no socket", [](const LinuxTree&) { return std::make_unique<Services>(); }},
    {"a socket where nobody listens", strangers(0)},
    {"no greeting", strangers(8)},
    {"a hang-up at the greeting", strangers(4, "")},
    {"rubbish as the greeting", strangers(4, "OK 1\r\nREJECTED\r\n\x1b[2J")},
    {"no such service", refusing("ServiceUnknown")},
    {"access denied", refusing("AccessDenied")},
    {"a question first", refusing("InteractiveAuthorizationRequired")},
    {"a service that left", refusing("NoReply")},
    {"no reply", answering([](auto*, auto&) { return 1; })},
    {"a hang-up", answering([](auto*, auto& peer) {
       peer.hangUp();
       return 1;
     })},
    {"a reply of other types",
     answering([](auto* call, auto&) { return sd_bus_reply_method_return(call, "tt", 1, 2); })},
    {"texts of nothing but controls",
     answering([](auto* call, auto&) { return sd_bus_reply_method_return(call, "v", "s", "\x1b[2J\n"); })},
    {"a number that nothing has",
     answering([](auto* call, auto&) { return sd_bus_reply_method_return(call, "v", "t", ~std::uint64_t{0}); })},
    {"64 MiB", answering(withTooMuch)},
};

using Command = void (*)(LinuxHost& host);
const PowerSource mains{"AC Power"};

const std::map<std::string, Command> getters{
    {"zone", [](LinuxHost& host) { host.clock().timeZone(); }},
    {"network time", [](LinuxHost& host) { host.networkTime().isRunning(); }},
    {"server", [](LinuxHost& host) { host.networkTime().server(); }},
    {"names", [](LinuxHost& host) { host.dynamicStore().open("test")->localHostName(); }},
    {"remote login", [](LinuxHost& host) { host.remoteShell().state(); }},
    {"computer sleep", [](LinuxHost& host) { host.powerSettings().untilSleep(SleepTimer::computer, mains); }},
};
const std::map<std::string, Command> setters{
    {"zone", [](LinuxHost& host) { host.clock().setTimeZone({"Asia/Tokyo"}); }},
    {"network time", [](LinuxHost& host) { host.networkTime().start(); }},
    {"network time with the machine", [](LinuxHost& host) { host.networkTime().setLaunchAtStartup(true); }},
    {"server", [](LinuxHost& host) { host.networkTime().setServer({"new.example"}); }},
    {"computer name", [](LinuxHost& host) { host.hostConfiguration().setComputerName("New"); }},
    {"remote login", [](LinuxHost& host) { host.remoteShell().setEnabled(true); }},
    {"computer sleep", [](LinuxHost& host) { host.powerSettings().setUntilSleep(SleepTimer::computer, mains, {20}); }},
};

/// A machine whose services are about to be asked.
struct BrokenTree : LinuxTree {
  BrokenTree() {
    write("/run/systemd/system/x", "");
    for (const auto* zone : {"Europe/Paris", "Asia/Tokyo"}) write("/usr/share/zoneinfo/" + std::string(zone), "TZif");
    link("/etc/localtime", "/usr/share/zoneinfo/Europe/Paris");
    write("/etc/machine-info", "PRETTY_HOSTNAME=Old\n");
    write("/etc/chrony/chrony.conf", "sourcedir /etc/chrony/sources.d\n");
    for (const auto* unit : {"ssh", "chrony"})
      write("/lib/systemd/system/" + std::string(unit) + ".service",
            "[Service]\n[Install]\nWantedBy=multi-user.target\n");
    write("/sys/power/state", "freeze mem\n");
  }

  std::map<std::string, std::string> files() const {
    std::map<std::string, std::string> found;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(at("/etc"))) {
      if (entry.is_symlink())
        found[entry.path()] = std::filesystem::read_symlink(entry.path());
      else if (entry.is_regular_file())
        found[entry.path()] = contentsOf(entry.path());
    }
    return found;
  }
};

Clock::duration timeOf(BrokenTree& tree, Command command) {
  const auto began = Clock::now();
  const auto waits = tree.runLoop.limitWaits(limit);
  command(tree.host());
  return Clock::now() - began;
}

TEST(BrokenBus, IsToldAndNeverWaitedForLongByAGetter) {
  for (const auto& [fault, put] : faults) {
    for (const auto& [name, command] : getters) {
      SCOPED_TRACE(name + ": " + fault);
      BrokenTree tree;
      const auto services = put(tree);
      const auto before = tree.files();
      EXPECT_LT(timeOf(tree, command), limit + tolerance);
      EXPECT_EQ(tree.files(), before);
      for (const auto& effect : tree.log.effects) {
        EXPECT_EQ(effect.outcome, Outcome::failed) << toJson(effect);
        EXPECT_FALSE(effect.failure->why.empty()) << toJson(effect);
      }
    }
  }
}

TEST(BrokenBus, LeavesNothingHalfSetUntold) {
  for (const auto& [fault, put] : faults) {
    for (const auto& [name, command] : setters) {
      SCOPED_TRACE(name + ": " + fault);
      BrokenTree tree;
      const auto services = put(tree);
      const auto before = tree.files();
      EXPECT_LT(timeOf(tree, command), limit + tolerance);
      const bool isChanged = tree.files() != before;
      ASSERT_FALSE(tree.log.effects.empty());
      bool saysChanged = false;
      for (const auto& effect : tree.log.effects) {
        saysChanged = saysChanged || effect.changed;
        const bool isTold = effect.outcome == Outcome::failed ? !effect.failure->why.empty()
                                                              : effect.live || effect.stored || effect.failure;
        EXPECT_TRUE(isTold) << toJson(effect);
        EXPECT_EQ(toJson(effect).find('\x1b'), std::string::npos);
      }
      EXPECT_TRUE(saysChanged || !isChanged) << toJson(tree.lastEffect());
    }
  }
}

TEST(BrokenBus, IsAskedOnceMoreForAPropertyOfAServiceThatWasLeaving) {
  BrokenTree tree;
  int asked = 0;
  const BusPeer peer(tree.at(sockets[0]), {}, [&](auto* call, const auto&) {
    if (asked++ == 0) return sd_bus_reply_method_errorf(call, "org.freedesktop.DBus.Error.NoReply", "it has left");
    return sd_bus_reply_method_return(call, "v", "s", "new.example");
  });
  const auto bus = tree.services.systemBus();
  ASSERT_TRUE(bus) << describe(bus.failure());
  auto name = (*bus)->property({"a.b", "/a", "a.b"}, "ServerName", "s");
  ASSERT_TRUE(name) << describe(name.failure());
  EXPECT_EQ(std::move(name).value().readText(), "new.example");
}

}  // namespace
}  // namespace tavisk

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include <chrono>
#include <string>
#include <vector>

#include "base/RunLoop.h"
#include "platform/DiskEventSession.h"

namespace tavisk {

/// Hears of the disks, a line each: "appeared DISK LABEL", "changed DISK path name", "gone DISK LABEL".
class DiskListener {
 public:
  DiskListener(DiskEventSession& session, RunLoop& runLoop) : _session(session), _runLoop(runLoop) {}
  ~DiskListener() { stop(); }
  DiskListener(const DiskListener&) = delete;
  DiskListener& operator=(const DiskListener&) = delete;

  void listen(DiskMatch match = {},
              std::vector<DiskKey> watch = {DiskKey::volumeName, DiskKey::volumePath, DiskKey::mediaSize}) {
    for (const auto kind :
         {DiskEvent::Kind::appeared, DiskEvent::Kind::descriptionChanged, DiskEvent::Kind::disappeared})
      _session.registerCallback({hear, this, kind, match, watch});
  }
  void stop() { _session.unregisterCallback(hear, this); }

  /// What was heard of these disks since the last call; others, on a real machine, are none of ours.
  std::vector<std::string> take(const std::vector<DiskName>& disks) {
    std::vector<std::string> taken;
    for (const auto& line : std::exchange(_lines, {}))
      for (const auto& disk : disks)
        if (line.find(" " + disk.text + " ") != std::string::npos) taken.push_back(line);
    return taken;
  }
  void forget() { _lines.clear(); }
  /// Waits until a line has come, and forgets it and those before it.
  testing::AssertionResult hears(const std::string& line) {
    const auto place = [&] { return std::ranges::find(_lines, line); };
    const auto deadline = RunLoop::Clock::now() + std::chrono::seconds(10);
    if (!_runLoop.runUntil(deadline, [&] { return place() != _lines.end(); }))
      return testing::AssertionFailure() << line << " among " << testing::PrintToString(_lines);
    _lines.erase(_lines.begin(), std::next(place()));
    return testing::AssertionSuccess();
  }

 private:
  static void hear(const DiskEvent& event, void* listener) { static_cast<DiskListener*>(listener)->note(event); }
  void note(const DiskEvent& event) {
    const auto disk = _session.description(event.disk);
    const auto label = disk ? disk->volumeName.value_or("") : "not described";
    switch (event.kind) {
      case DiskEvent::Kind::appeared:
        return _lines.push_back("appeared " + event.disk.text + " " + label);
      case DiskEvent::Kind::disappeared:
        return _lines.push_back("gone " + event.disk.text + " " + label);
      case DiskEvent::Kind::descriptionChanged:
        return _lines.push_back("changed " + event.disk.text + namesOf(event.changed));
    }
  }
  static std::string namesOf(const std::vector<DiskKey>& keys) {
    std::string names;
    for (const auto key : keys)
      names += key == DiskKey::volumePath ? " path" : key == DiskKey::volumeName ? " name" : " size";
    return names;
  }

  DiskEventSession& _session;
  RunLoop& _runLoop;
  std::vector<std::string> _lines;
};

/// `Machine` offers: `run(work)`, which calls the work with a machine of its own and says why it could not; service();
/// runLoop(); plug(label), a volume that is not mounted; mount(disk), which answers where; unmount, rename(disk,
/// label), grow and pull.
template <typename Machine>
struct DiskEventsContract : testing::Test {
  template <typename Work>
  void run(const Work& work) {
    const auto why = Machine::run(work);
    if (!why.empty()) GTEST_SKIP() << why;
  }
  /// A volume that was plugged in and then mounted, both heard by the listener; and where it is mounted.
  static std::pair<DiskName, std::string> addVolume(Machine& machine, DiskListener& listener) {
    machine.service().schedule(machine.runLoop());
    listener.listen();
    machine.runLoop().runPass();
    const auto disk = machine.plug("Backup");
    listener.forget();
    EXPECT_TRUE(listener.hears("appeared " + disk.text + " Backup"));
    EXPECT_EQ(machine.service().description(disk)->volumePath, std::nullopt);
    const auto path = machine.mount(disk);
    EXPECT_TRUE(listener.hears("changed " + disk.text + " path"));
    return {disk, path};
  }
};

TYPED_TEST_SUITE_P(DiskEventsContract);

TYPED_TEST_P(DiskEventsContract, tellsInOnePassWhatIsMounted) {
  this->run([](TypeParam& machine) {
    const auto first = machine.plug("first");
    const auto second = machine.plug("second");
    machine.mount(first);
    machine.mount(second);
    DiskListener listener(machine.service(), machine.runLoop());
    machine.service().schedule(machine.runLoop());
    listener.listen({true, false});
    EXPECT_THAT(listener.take({first, second}), testing::IsEmpty());
    machine.runLoop().runPass();
    EXPECT_THAT(listener.take({first, second}), testing::UnorderedElementsAre("appeared " + first.text + " first",
                                                                              "appeared " + second.text + " second"));
    machine.service().unschedule();
  });
}

TYPED_TEST_P(DiskEventsContract, tellsWhatHappensToAVolume) {
  this->run([](TypeParam& machine) {
    auto& session = machine.service();
    DiskListener listener(session, machine.runLoop());
    const auto [disk, path] = TestFixture::addVolume(machine, listener);
    EXPECT_EQ(session.description(disk)->volumePath, path);
    machine.rename(disk, "Archive");
    EXPECT_TRUE(listener.hears("changed " + disk.text + " name"));
    EXPECT_EQ(session.description(disk)->volumeName, "Archive");
    const auto size = session.description(disk)->mediaSize;
    machine.grow(disk);
    EXPECT_TRUE(listener.hears("changed " + disk.text + " size"));
    EXPECT_GT(session.description(disk)->mediaSize, size);
    machine.unmount(disk);
    EXPECT_TRUE(listener.hears("changed " + disk.text + " path"));
    EXPECT_EQ(session.description(disk)->volumePath, std::nullopt);
    machine.pull(disk);
    EXPECT_TRUE(listener.hears("gone " + disk.text + " Archive"));
    EXPECT_EQ(session.description(disk), nullptr);
    session.unschedule();
  });
}

TYPED_TEST_P(DiskEventsContract, tellsOnlyThoseWhoAsked) {
  this->run([](TypeParam& machine) {
    auto& session = machine.service();
    DiskListener all(session, machine.runLoop());
    DiskListener ofNetwork(session, machine.runLoop());
    DiskListener ofNames(session, machine.runLoop());
    DiskListener stopped(session, machine.runLoop());
    session.schedule(machine.runLoop());
    all.listen();
    ofNetwork.listen({std::nullopt, true});
    ofNames.listen({}, {DiskKey::volumeName});
    stopped.listen();
    stopped.stop();
    const auto disk = machine.plug("Backup");
    all.forget();
    ofNames.forget();
    EXPECT_TRUE(all.hears("appeared " + disk.text + " Backup"));
    machine.mount(disk);
    EXPECT_TRUE(all.hears("changed " + disk.text + " path"));
    EXPECT_THAT(ofNetwork.take({disk}), testing::IsEmpty());
    EXPECT_THAT(ofNames.take({disk}), testing::ElementsAre("appeared " + disk.text + " Backup"));
    EXPECT_THAT(stopped.take({disk}), testing::IsEmpty());
    session.unschedule();
  });
}

TYPED_TEST_P(DiskEventsContract, findsTheDiskOfAPath) {
  this->run([](TypeParam& machine) {
    auto& session = machine.service();
    DiskListener listener(session, machine.runLoop());
    const auto [disk, path] = TestFixture::addVolume(machine, listener);
    EXPECT_EQ(session.diskOfPath(path), disk);
    EXPECT_EQ(session.diskOfPath(path + "/./../" + path.substr(path.rfind('/') + 1) + "/"), disk);
    EXPECT_EQ(session.diskOfPath(path + "/none"), std::nullopt);
    EXPECT_NE(session.diskOfPath(path.substr(0, path.rfind('/'))), disk);
    EXPECT_EQ(session.diskOfPath("none"), std::nullopt);
    EXPECT_EQ(session.wholeDisk(disk), disk);
    EXPECT_EQ(session.description({"none"}), nullptr);
    session.unschedule();
  });
}

REGISTER_TYPED_TEST_SUITE_P(DiskEventsContract, tellsInOnePassWhatIsMounted, tellsWhatHappensToAVolume,
                            tellsOnlyThoseWhoAsked, findsTheDiskOfAPath);

}  // namespace tavisk

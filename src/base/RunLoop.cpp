// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/RunLoop.h"

#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <sys/timerfd.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <system_error>
#include <utility>
#include <vector>

#include "base/FileDescriptor.h"

namespace tavisk {
namespace {

using TimePoint = RunLoop::Clock::time_point;
using Duration = RunLoop::Clock::duration;
using Work = RunLoop::Work;

/// A descriptor that the loop needs, as `call` gave it.
FileDescriptor needed(int descriptor, const char* call) {
  if (descriptor < 0) throw std::system_error(errno, std::generic_category(), call);
  return FileDescriptor(descriptor);
}

/// Takes the count out of an eventfd or timerfd, so that it is ready no more.
void drain(const FileDescriptor& counter) {
  std::uint64_t count = 0;
  static_cast<void>(!::read(counter.number(), &count, sizeof count));
}

struct Timer {
  Duration interval;  ///< 0: runs once
  Work work;
  /// When it is due and, among equals, which was armed first; the timer's place in State::timers.
  std::pair<TimePoint, std::uint64_t> place;
  bool isCancelled = false;
};

struct Watch {
  int descriptor;
  std::uint32_t events;
  Work work;
  bool isQueued = false;
  bool isCancelled = false;
};

TimePoint afterNow(Duration delay) {
  const auto now = RunLoop::Clock::now();
  return delay > TimePoint::max() - now ? TimePoint::max() : now + std::max(delay, Duration::zero());
}

}  // namespace

struct RunLoop::State {
  FileDescriptor epoll = needed(epoll_create1(EPOLL_CLOEXEC), "epoll_create1");
  FileDescriptor alarm = needed(timerfd_create(CLOCK_MONOTONIC, TFD_CLOEXEC | TFD_NONBLOCK), "timerfd_create");
  FileDescriptor wakeUp = needed(eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK), "eventfd");

  std::mutex mutex;  ///< of the next three
  std::deque<Work> posted;
  std::uint64_t postedSoFar = 0;
  std::uint64_t takenSoFar = 0;

  std::map<std::pair<TimePoint, std::uint64_t>, std::shared_ptr<Timer>> timers;
  std::uint64_t armedSoFar = 0;
  std::map<int, std::vector<std::shared_ptr<Watch>>> watches;
  std::deque<std::shared_ptr<Watch>> ready;
  bool isStopped = false;
  TimePoint limit = TimePoint::max();

  State() {
    for (const auto* own : {&alarm, &wakeUp}) {
      if (!setEvents(own->number(), EPOLLIN)) throw std::system_error(errno, std::generic_category(), "epoll_ctl");
    }
  }

  bool setEvents(int descriptor, std::uint32_t events) const {
    epoll_event event{};
    event.events = events;
    event.data.fd = descriptor;
    if (events == 0) return epoll_ctl(epoll.number(), EPOLL_CTL_DEL, descriptor, &event) == 0;
    if (epoll_ctl(epoll.number(), EPOLL_CTL_ADD, descriptor, &event) == 0) return true;
    return errno == EEXIST && epoll_ctl(epoll.number(), EPOLL_CTL_MOD, descriptor, &event) == 0;
  }

  /// One registration a descriptor is all that epoll allows: it gets what all watches of the descriptor want.
  bool updateEvents(int descriptor) {
    std::uint32_t events = 0;
    const auto found = watches.find(descriptor);
    if (found != watches.end()) {
      for (const auto& watch : found->second) events |= watch->events;
    }
    return setEvents(descriptor, events);
  }

  void arm(const std::shared_ptr<Timer>& timer, TimePoint due) {
    timer->place = {due, ++armedSoFar};
    timers.emplace(timer->place, timer);
  }

  void cancel(Timer& timer) {
    timer.isCancelled = true;
    timers.erase(timer.place);
  }

  void cancel(Watch& watch) {
    watch.isCancelled = true;
    const auto others = watches.find(watch.descriptor);
    if (others == watches.end()) return;
    std::erase_if(others->second, [&watch](const auto& other) { return other.get() == &watch; });
    if (others->second.empty()) watches.erase(others);
    updateEvents(watch.descriptor);
  }

  void post(Work work) {
    const std::scoped_lock lock(mutex);
    posted.push_back(std::move(work));
    ++postedSoFar;
    // The loop does not wait while there is posted work: only the first has to wake it.
    if (posted.size() == 1) eventfd_write(wakeUp.number(), 1);
  }

  Work takePosted(std::uint64_t last) {
    const std::scoped_lock lock(mutex);
    if (takenSoFar >= last) return nullptr;
    auto work = std::move(posted.front());
    posted.pop_front();
    ++takenSoFar;
    return work;
  }

  void runPosted(std::uint64_t last) {
    while (const auto work = takePosted(last)) work();
  }

  std::shared_ptr<Timer> takeTimer(TimePoint passBegin, std::uint64_t lastArmed) {
    if (timers.empty()) return nullptr;
    const auto [due, order] = timers.begin()->first;
    if (due > passBegin || order > lastArmed) return nullptr;
    auto timer = timers.begin()->second;
    timers.erase(timers.begin());
    return timer;
  }

  void runTimers(TimePoint passBegin, std::uint64_t lastArmed) {
    while (const auto timer = takeTimer(passBegin, lastArmed)) {
      auto work = std::move(timer->work);
      work();
      if (timer->interval == Duration::zero() || timer->isCancelled) continue;
      timer->work = std::move(work);
      // A repetition that was missed is dropped.
      arm(timer, std::max(timer->place.first + timer->interval, Clock::now()));
    }
  }

  /// Notes which watches epoll finds ready; waits for at least one event, or not at all. What epoll has told must be
  /// kept: some files (/proc/self/mountinfo) tell of a change only once.
  void collectReady(bool wait) {
    std::array<epoll_event, 32> events{};
    const auto count = epoll_wait(epoll.number(), events.data(), static_cast<int>(events.size()), wait ? -1 : 0);
    for (int place = 0; place < count; ++place) noteReady(events[static_cast<std::size_t>(place)]);
  }

  void noteReady(const epoll_event& event) {
    if (event.data.fd == alarm.number()) return drain(alarm);
    if (event.data.fd == wakeUp.number()) return drain(wakeUp);
    const auto found = watches.find(event.data.fd);
    if (found == watches.end()) return;
    for (const auto& watch : found->second) {
      if (watch->isQueued || (event.events & (watch->events | EPOLLERR | EPOLLHUP)) == 0) continue;
      watch->isQueued = true;
      ready.push_back(watch);
    }
  }

  /// Pass in pass: the inner one runs also what the outer one found ready and has not yet run.
  void runReady() {
    for (auto left = ready.size(); left > 0 && !ready.empty(); --left) {
      const auto watch = ready.front();
      ready.pop_front();
      watch->isQueued = false;
      if (!watch->isCancelled) watch->work();
    }
  }

  void runPass() {
    collectReady(false);
    const auto begin = Clock::now();
    const auto lastArmed = armedSoFar;
    const auto lastPosted = [this] {
      const std::scoped_lock lock(mutex);
      return postedSoFar;
    }();
    runPosted(lastPosted);
    runTimers(begin, lastArmed);
    runReady();
  }

  bool hasPosted() {
    const std::scoped_lock lock(mutex);
    return !posted.empty();
  }

  /// Waits until there is something for a pass to do, or until the deadline; may return early.
  void wait(TimePoint deadline) {
    if (hasPosted() || !ready.empty()) return;
    setAlarm(timers.empty() ? deadline : std::min(deadline, timers.begin()->first.first));
    collectReady(true);
  }

  void setAlarm(TimePoint due) const {
    itimerspec setting{};  // zero: never
    if (due != TimePoint::max()) {
      const auto sinceBoot = std::max<Duration>(due.time_since_epoch(), std::chrono::nanoseconds(1));
      const auto seconds = std::chrono::floor<std::chrono::seconds>(sinceBoot);
      setting.it_value.tv_sec = seconds.count();
      setting.it_value.tv_nsec = std::chrono::nanoseconds(sinceBoot - seconds).count();
    }
    timerfd_settime(alarm.number(), TFD_TIMER_ABSTIME, &setting, nullptr);
  }
};

namespace {

/// The registration outlives the loop without harm.
template <typename State, typename Entry>
RunLoop::Registration registrationOf(const std::shared_ptr<State>& state, const std::shared_ptr<Entry>& entry) {
  return RunLoop::Registration([loop = std::weak_ptr(state), entry] {
    if (const auto living = loop.lock()) living->cancel(*entry);
  });
}

}  // namespace

RunLoop::Registration::Registration(Registration&& other) noexcept : _cancel(std::exchange(other._cancel, nullptr)) {}

RunLoop::Registration& RunLoop::Registration::operator=(Registration&& other) noexcept {
  if (this == &other) return *this;
  cancel();
  _cancel = std::exchange(other._cancel, nullptr);
  return *this;
}

RunLoop::Registration::~Registration() {
  cancel();
}

void RunLoop::Registration::cancel() {
  if (const auto cancel = std::exchange(_cancel, nullptr)) cancel();
}

RunLoop::RunLoop() : _state(std::make_shared<State>()) {}
RunLoop::~RunLoop() = default;

void RunLoop::post(Work work) {
  _state->post(std::move(work));
}

RunLoop::Registration RunLoop::after(Clock::duration delay, Work work) {
  const auto timer = std::make_shared<Timer>(Timer{Duration::zero(), std::move(work), {}});
  auto registration = registrationOf(_state, timer);
  _state->arm(timer, afterNow(delay));
  return registration;
}

RunLoop::Registration RunLoop::every(Clock::duration interval, Work work) {
  const auto timer = std::make_shared<Timer>(Timer{interval, std::move(work), {}});
  auto registration = registrationOf(_state, timer);
  _state->arm(timer, afterNow(interval));
  return registration;
}

RunLoop::Registration RunLoop::watch(int descriptor, Readiness readiness, Work work) {
  const std::uint32_t events = readiness == Readiness::readable ? EPOLLIN : EPOLLPRI;
  const auto watch = std::make_shared<Watch>(Watch{descriptor, events, std::move(work)});
  auto registration = registrationOf(_state, watch);
  _state->watches[descriptor].push_back(watch);
  if (_state->updateEvents(descriptor)) return registration;
  return {};
}

RunLoop::Registration RunLoop::limitWaits(Clock::duration together) {
  const auto before = _state->limit;
  _state->limit = std::min(before, afterNow(together));
  return Registration([state = _state, before] { state->limit = before; });
}

RunLoop::Registration RunLoop::pauseLimit() {
  if (_state->limit == TimePoint::max()) return {};
  const auto left = std::exchange(_state->limit, TimePoint::max()) - Clock::now();
  return Registration([state = _state, left] { state->limit = Clock::now() + left; });
}

RunLoop::Clock::duration RunLoop::timeFor(Clock::duration longest) const {
  return std::clamp(_state->limit - Clock::now(), Duration::zero(), longest);
}

void RunLoop::runPass() {
  _state->runPass();
}

void RunLoop::runUntil(Clock::time_point deadline) {
  const auto end = std::min(deadline, _state->limit);
  runPass();
  while (Clock::now() < end) {
    _state->wait(end);
    runPass();
  }
}

bool RunLoop::runUntil(Clock::time_point deadline, const std::function<bool()>& condition) {
  const auto end = std::min(deadline, _state->limit);
  while (!condition()) {
    if (Clock::now() >= end) return false;
    _state->wait(end);
    runPass();
  }
  return true;
}

void RunLoop::run() {
  const auto wasStopped = std::exchange(_state->isStopped, false);
  runPass();
  while (!_state->isStopped) {
    _state->wait(Clock::time_point::max());
    runPass();
  }
  _state->isStopped = wasStopped;
}

void RunLoop::stop() {
  _state->isStopped = true;
}

}  // namespace tavisk

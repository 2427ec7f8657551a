// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/Bus.h"

#include <fcntl.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <string_view>

#include "base/Result.h"
#include "hosts/linux/system/LocalSocket.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds timeForQuestions{300};
constexpr const char* propertiesInterface = "org.freedesktop.DBus.Properties";

struct KnownError {
  BusErrorCode code;
  std::string_view name;
};
constexpr KnownError knownErrors[] = {
    {BusErrorCode::serviceUnknown, "org.freedesktop.DBus.Error.ServiceUnknown"},
    {BusErrorCode::fileNotFound, "org.freedesktop.DBus.Error.FileNotFound"},
    {BusErrorCode::accessDenied, "org.freedesktop.DBus.Error.AccessDenied"},
    {BusErrorCode::interactionRequired, "org.freedesktop.DBus.Error.InteractiveAuthorizationRequired"},
    {BusErrorCode::timeSyncEnabled, "org.freedesktop.timedate1.AutomaticTimeSyncEnabled"},
};

class BusErrorCategory final : public std::error_category {
 public:
  const char* name() const noexcept override { return "bus"; }
  std::string message(int code) const override {
    const auto* known = std::ranges::find(knownErrors, static_cast<BusErrorCode>(code), &KnownError::code);
    return known == std::end(knownErrors) ? "unknown" : std::string(known->name);
  }
};

std::error_code codeOf(std::string_view name, int result) {
  const auto* known = std::ranges::find(knownErrors, name, &KnownError::name);
  return known == std::end(knownErrors) ? std::error_code(-result, std::generic_category()) : known->code;
}

std::uint64_t microseconds(std::chrono::microseconds time) {
  return static_cast<std::uint64_t>(time.count());
}

/// An error of the bus and its texts.
class BusError {
 public:
  explicit BusError(const SystemdLibrary& library) : _library(library) {}
  BusError(const BusError&) = delete;
  BusError& operator=(const BusError&) = delete;
  ~BusError() { _library.sd_bus_error_free(&_error); }
  sd_bus_error* handle() { return &_error; }

  Failure failure(const char* member, const BusObject& object, int result) const {
    if (!_error.name) return systemFailure(member, object.path, -result);
    const std::string name = _error.name;
    Failure failure{member, object.path, name + ": " + (_error.message ? _error.message : ""), codeOf(name, result)};
    if (failure.code == BusErrorCode::accessDenied || failure.code == BusErrorCode::interactionRequired)
      if (const auto need = whyNeedsRoot(member, object.path)) failure.why += "; " + need->why;
    return failure;
  }

 private:
  const SystemdLibrary& _library;
  sd_bus_error _error = SD_BUS_ERROR_NULL;
};

}  // namespace

std::error_code make_error_code(BusErrorCode code) {
  static const BusErrorCategory category;
  return {static_cast<int>(code), category};
}

Bus::Bus(const SystemdLibrary& library, sd_bus* bus, Kind kind, RunLoop* runLoop)
    : _library(library), _bus(bus), _kind(kind), _runLoop(runLoop) {}

Bus::~Bus() {
  _library.sd_bus_close_unref(_bus);
}

Result<std::unique_ptr<Bus>> Bus::open(const SystemdLibrary& library, const SystemRoot& root, const std::string& socket,
                                       Kind kind, RunLoop* runLoop) {
  const auto connection = connectLocalSocket(root, socket, SOCK_STREAM | SOCK_NONBLOCK);
  if (!connection) return connection.failure();
  sd_bus* handle = nullptr;
  if (const int result = library.sd_bus_new(&handle); result < 0) return systemFailure("sd_bus_new", socket, -result);
  std::unique_ptr<Bus> bus(new Bus(library, handle, kind, runLoop));
  const int result = bus->start(*connection);
  if (result == -ETIMEDOUT) return Failure{"start the connection", socket, "timed out before anything was asked"};
  if (result < 0) return systemFailure("start the connection", socket, -result);
  return bus;
}

int Bus::start(const FileDescriptor& connection) {
  const int own = ::fcntl(connection.number(), F_DUPFD_CLOEXEC, 0);
  if (own < 0) return -errno;
  if (const int result = _library.sd_bus_set_fd(_bus, own, own); result < 0) return result;
  if (_kind == Kind::messageBus) _library.sd_bus_set_bus_client(_bus, 1);
  if (const int result = _library.sd_bus_start(_bus); result < 0) return result;
  return awaitReady();
}

std::chrono::microseconds Bus::timeFor(std::chrono::seconds longest) const {
  if (!_runLoop) return longest;
  return std::chrono::duration_cast<std::chrono::microseconds>(_runLoop->timeFor(longest));
}

/// The library itself would wait for its peer's greeting far longer than a command may last.
int Bus::awaitReady() {
  const auto deadline = std::chrono::steady_clock::now() + timeFor(usualTime);
  while (_library.sd_bus_is_ready(_bus) == 0) {
    const int result = _library.sd_bus_process(_bus, nullptr);
    if (result < 0) return result;
    if (result > 0) continue;
    const auto left =
        std::chrono::duration_cast<std::chrono::microseconds>(deadline - std::chrono::steady_clock::now());
    if (left.count() <= 0) return -ETIMEDOUT;
    if (const int waited = _library.sd_bus_wait(_bus, microseconds(left)); waited < 0) return waited;
  }
  return 0;
}

bool Bus::isOpen() const {
  return _library.sd_bus_is_open(_bus) > 0;
}

std::string Bus::uniqueName() const {
  const char* name = nullptr;
  return _library.sd_bus_get_unique_name(_bus, &name) < 0 ? std::string() : name;
}

const char* Bus::destination(const BusObject& object) const {
  return _kind == Kind::messageBus ? object.service : nullptr;
}

bool Bus::wasSilent(const BusObject& object) const {
  const auto since = _silentSince.find(object.service);
  return since != _silentSince.end() && std::chrono::steady_clock::now() - since->second < timeWithoutRetry;
}

Result<BusMessage> Bus::call(const BusObject& object, const char* member, const char* replySignature,
                             const Writer& arguments, std::chrono::seconds longest) {
  return exchange(object, member, replySignature, arguments, false, longest);
}

Result<BusMessage> Bus::callWithQuestion(const BusObject& object, const char* member, const char* replySignature,
                                         const Writer& arguments) {
  return exchange(object, member, replySignature, arguments, true, timeForQuestions);
}

Result<BusMessage> Bus::exchange(const BusObject& object, const char* member, const char* replySignature,
                                 const Writer& arguments, bool isQuestion, std::chrono::seconds longest) {
  if (wasSilent(object)) return Failure{member, object.path, "this service has just left a call without an answer"};
  sd_bus_message* handle = nullptr;
  int result = _library.sd_bus_message_new_method_call(_bus, &handle, destination(object), object.path.c_str(),
                                                       object.interface, member);
  if (result < 0) return systemFailure(member, object.path, -result);
  BusMessage request(_library, handle);
  arguments(request);
  if (const auto error = request.error()) return systemFailure(member, object.path, error.value());
  const auto left = timeFor(longest);
  if (left.count() == 0) return Failure{member, object.path, "timed out before it was sent"};
  const auto question = isQuestion && _runLoop ? _runLoop->pauseLimit() : RunLoop::Registration();

  BusError error(_library);
  sd_bus_message* answer = nullptr;
  const auto began = std::chrono::steady_clock::now();
  result = _library.sd_bus_call(_bus, handle, microseconds(isQuestion ? longest : left), error.handle(), &answer);
  // A service that ended during the call has the same error at once.
  const auto now = std::chrono::steady_clock::now();
  if (result == -ETIMEDOUT && now - began >= longest) _silentSince[object.service] = now;
  if (result < 0) return error.failure(member, object, result);
  BusMessage reply(_library, answer);
  if (_library.sd_bus_message_has_signature(answer, replySignature) <= 0)
    return Failure{member, object.path, "the reply has other types than expected"};
  return reply;
}

Result<BusMessage> Bus::property(const BusObject& object, const char* name, const char* signature) {
  const BusObject properties{object.service, object.path, propertiesInterface};
  const auto ask = [&] { return call(properties, "Get", "v", object.interface, name); };
  auto reply = ask();
  // A service that was about to leave, to be started anew, when it was asked.
  if (!reply && reply.failure().code == std::errc::timed_out && !wasSilent(object))
    if (auto second = ask()) reply = std::move(second);
  if (!reply) return retold(reply.failure(), name, object.path);
  auto value = std::move(reply).value();
  if (!value.enter('v', signature)) return Failure{name, object.path, "the value has another type than expected"};
  return value;
}

Result<BusMessage> Bus::setProperty(const BusObject& object, const char* name, const char* signature,
                                    const Writer& value) {
  const BusObject properties{object.service, object.path, propertiesInterface};
  const Writer arguments = [&](BusMessage& message) {
    message.write(object.interface);
    message.write(name);
    message.open('v', signature);
    value(message);
    message.close();
  };
  return call(properties, "Set", "", arguments);
}

Bus::Subscription::Subscription(const SystemdLibrary& library, SignalHandler handler)
    : _library(library), _handler(std::move(handler)) {}

Bus::Subscription::~Subscription() {
  _library.sd_bus_slot_unref(_slot);
}

int Bus::Subscription::receive(sd_bus_message* message, void* subscription, sd_bus_error* /*error*/) {
  auto* self = static_cast<Subscription*>(subscription);
  BusMessage signal(self->_library, self->_library.sd_bus_message_ref(message));
  self->_handler(signal);
  return 0;
}

Result<std::unique_ptr<Bus::Subscription>> Bus::subscribe(const BusObject& object, const char* signal,
                                                          SignalHandler handler) {
  auto subscription = std::make_unique<Subscription>(_library, std::move(handler));
  const int result = _library.sd_bus_match_signal(_bus, &subscription->_slot, destination(object), object.path.c_str(),
                                                  object.interface, signal, &Subscription::receive, subscription.get());
  if (result < 0) return systemFailure(signal, object.path, -result);
  return subscription;
}

int Bus::descriptor() const {
  return _library.sd_bus_get_fd(_bus);
}

void Bus::process() {
  while (_library.sd_bus_process(_bus, nullptr) > 0) {
  }
}

}  // namespace tavisk

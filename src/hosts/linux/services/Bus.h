// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/linux/services/BusMessage.h"
#include "hosts/linux/services/SystemdLibrary.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Whom a call is for: the well-known name of a service, one of its objects, an interface of that.
struct BusObject {
  const char* service;
  std::string path;
  const char* interface;
};

/// The errors of the bus that callers tell apart, as codes of a failure. Any other has the errno value that the library
/// gives for it (sd_bus_error_get_errno(3)).
enum class BusErrorCode { serviceUnknown = 1, fileNotFound, accessDenied, interactionRequired, timeSyncEnabled };
std::error_code make_error_code(BusErrorCode code);

/// A connection to the message bus, or straight to one service. Used by one thread. A failure of a call begins its
/// reason with the name of the error; a reply of another signature than expected is a failure.
class Bus {
 public:
  enum class Kind { messageBus, straightToService };

  static constexpr std::chrono::seconds usualTime{5};
  static constexpr std::chrono::seconds timeWithoutRetry{10};

  /// Connects to a socket beneath the root; no variable of the environment says where. Calls keep to the limit of the
  /// loop, which is null for a connection that another thread than the loop's uses. `library` and the loop must outlive
  /// the connection.
  static Result<std::unique_ptr<Bus>> open(const SystemdLibrary& library, const SystemRoot& root,
                                           const std::string& socket, Kind kind, RunLoop* runLoop);
  Bus(const Bus&) = delete;
  Bus& operator=(const Bus&) = delete;
  ~Bus();

  bool isOpen() const;
  /// By which others on the message bus know this connection.
  std::string uniqueName() const;

  using Writer = std::function<void(BusMessage&)>;
  /// Calls and waits for the reply. The user is asked nothing meanwhile: a service that wants a password first refuses
  /// (interactionRequired). One that has not answered in time (timed_out) is not asked again for a while: calls to it
  /// fail at once. They, and calls for which no time is left, fail without that code: nothing was sent.
  Result<BusMessage> call(const BusObject& object, const char* member, const char* replySignature,
                          const Writer& arguments, std::chrono::seconds longest = usualTime);
  template <typename... Arguments>
  Result<BusMessage> call(const BusObject& object, const char* member, const char* replySignature,
                          const Arguments&... arguments) {
    return call(object, member, replySignature, Writer([&](BusMessage& message) { (message.write(arguments), ...); }));
  }
  /// As call(), of a service that asks the user meanwhile: the time of the question does not count against the limit.
  Result<BusMessage> callWithQuestion(const BusObject& object, const char* member, const char* replySignature,
                                      const Writer& arguments);
  /// The value of a property, ready to be read.
  Result<BusMessage> property(const BusObject& object, const char* name, const char* signature);
  /// `value` writes one of this type.
  Result<BusMessage> setProperty(const BusObject& object, const char* name, const char* signature, const Writer& value);

  using SignalHandler = std::function<void(BusMessage&)>;
  /// Keeps a handler; its end takes the handler out. It ends before the bus.
  class Subscription {
   public:
    Subscription(const SystemdLibrary& library, SignalHandler handler);
    Subscription(const Subscription&) = delete;
    Subscription& operator=(const Subscription&) = delete;
    ~Subscription();

   private:
    friend class Bus;
    static int receive(sd_bus_message* message, void* subscription, sd_bus_error* error);

    const SystemdLibrary& _library;
    SignalHandler _handler;
    sd_bus_slot* _slot = nullptr;
  };
  /// The handler is called from process() with each signal.
  Result<std::unique_ptr<Subscription>> subscribe(const BusObject& object, const char* signal, SignalHandler handler);

  /// Readable when there is something to process.
  int descriptor() const;
  /// Handles what has arrived; never waits.
  void process();

 private:
  Bus(const SystemdLibrary& library, sd_bus* bus, Kind kind, RunLoop* runLoop);
  std::chrono::microseconds timeFor(std::chrono::seconds longest) const;
  /// These two answer as the library does: negative is an errno value.
  int start(const FileDescriptor& connection);
  int awaitReady();
  Result<BusMessage> exchange(const BusObject& object, const char* member, const char* replySignature,
                              const Writer& arguments, bool isQuestion, std::chrono::seconds longest);
  const char* destination(const BusObject& object) const;
  bool wasSilent(const BusObject& object) const;

  const SystemdLibrary& _library;
  sd_bus* _bus;
  Kind _kind;
  RunLoop* _runLoop;
  std::map<std::string, std::chrono::steady_clock::time_point, std::less<>> _silentSince;  ///< by service
};

}  // namespace tavisk

template <>
struct std::is_error_code_enum<tavisk::BusErrorCode> : std::true_type {};

// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <filesystem>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "base/FileDescriptor.h"

struct sd_bus_message;
struct sd_bus;

namespace tavisk {

/// Hands each method call that comes in to a function, from a thread of its own.
class BusPeer {
 public:
  /// Replies to the call, or lets it wait for ever; runs on the peer's thread.
  using Answer = std::function<int(sd_bus_message* call, const std::string& member)>;

  /// Without names the socket is the peer's own, and to its callers, one after the other, it is one service or the
  /// message bus with all services behind it. With names it joins the message bus whose socket it is.
  BusPeer(const std::filesystem::path& socket, const std::vector<std::string>& namesOnBus, Answer answer);
  BusPeer(const BusPeer&) = delete;
  BusPeer& operator=(const BusPeer&) = delete;
  ~BusPeer();

  /// Ends the connection whose call is being answered.
  void hangUp() { _hangUp = true; }

 private:
  static int receive(sd_bus_message* message, void* peer, void* error);
  void serveCallers();
  void serve(sd_bus* bus);

  FileDescriptor _listener;
  FileDescriptor _wake;
  Answer _answer;
  std::atomic<bool> _hangUp = false;
  std::thread _thread;
};

/// A socket in the file system; `type` is SOCK_STREAM or SOCK_DGRAM.
FileDescriptor socketAt(const std::filesystem::path& path, int type);

/// The next argument of a call, a text.
std::string firstText(sd_bus_message* message);

}  // namespace tavisk

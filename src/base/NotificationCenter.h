// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <any>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

struct Notification {
  std::string name;
  std::any object;  ///< empty when the notification has no object
};

/// Tells observers of named events, at once and in the order in which they were added. Main thread only.
/// Handlers may post, add and remove: an observer added meanwhile is told from the next post on, a removed one no more.
class NotificationCenter {
 public:
  using Handler = std::function<void(const Notification&)>;

  /// `observer` only identifies the observation for removeObserver. An empty name observes every notification.
  void addObserver(const void* observer, std::string name, Handler handler);
  /// Ends every observation of this observer.
  void removeObserver(const void* observer);
  void post(std::string_view name, std::any object = {});

 private:
  struct Observation {
    const void* observer;
    std::string name;
    Handler handler;
    bool hasEnded = false;
  };
  std::vector<std::shared_ptr<Observation>> _observations;
};

}  // namespace tavisk

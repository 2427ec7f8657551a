// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "base/NotificationCenter.h"

namespace tavisk {
namespace {

using ::testing::ElementsAre;

struct NotificationCenterTest : ::testing::Test {
  NotificationCenter::Handler note(const std::string& who) {
    return [this, who](const Notification& notification) { told.push_back(who + " " + notification.name); };
  }

  NotificationCenter center;
  std::vector<std::string> told;
  const int anna = 0;
  const int bert = 0;
};

TEST_F(NotificationCenterTest, tellsThoseWhoWantToKnowInOrder) {
  center.addObserver(&bert, "", note("bert"));
  center.addObserver(&anna, "appeared", note("anna"));
  center.addObserver(&anna, "left", note("anna"));
  center.post("appeared");
  center.post("left");
  center.removeObserver(&anna);
  center.post("appeared");
  EXPECT_THAT(told, ElementsAre("bert appeared", "anna appeared", "bert left", "anna left", "bert appeared"));
}

TEST_F(NotificationCenterTest, letsHandlersChangeTheObserversAndPost) {
  center.addObserver(&anna, "first", [this](const Notification& notification) {
    note("anna")(notification);
    center.removeObserver(&anna);
    center.removeObserver(&bert);
    for (int more = 0; more < 20; ++more) center.addObserver(&told, "second", note("new"));
    center.removeObserver(&told);
    center.addObserver(&told, "", note("new"));
    center.post("second");
  });
  center.addObserver(&bert, "first", note("bert"));
  center.post("first");
  EXPECT_THAT(told, ElementsAre("anna first", "new second"));
}

}  // namespace
}  // namespace tavisk

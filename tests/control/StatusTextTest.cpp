// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "base/Calendar.h"
#include "control/status/StatusText.h"

namespace tavisk::control {
namespace {

struct Shown {
  const char* value;
  const char* unit;
  const char* text;
};

TEST(StatusText, ShowsValuesInTheirUnits) {
  setDefaultTimeZone("");
  for (const auto& [value, unit, text] : {
           Shown{"0", "minutes", "never"},
           Shown{"1", "minutes", "1 minute"},
           Shown{"10", "minutes", "10 minutes"},
           Shown{"10 on sda, 0 on sdb", "minutes", "10 on sda, 0 on sdb (minutes)"},
           Shown{"-1", "seconds since 1970", "1969-12-31 23:59:59"},
           Shown{"253402300800", "seconds since 1970", "10000-01-01 00:00:00"},
           Shown{"3", "units of 30 seconds", "90 seconds"},
           Shown{"9223372036854775807", "units of 30 seconds", "-30 seconds"},
           Shown{"0", "", "0"},
           Shown{"5", "parsecs", "5 parsecs"},
       })
    EXPECT_EQ(shownValue(value, unit), text);
}

}  // namespace
}  // namespace tavisk::control

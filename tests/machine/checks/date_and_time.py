# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CLOCK = frozenset({"clock"})
# The same day in the zone and in the hardware clock's UTC.
SET = "TAVISK_LOG=stderr tavisk -setusingnetworktime off -settimezone Asia/Kolkata -setdate 3/7/2031 -settime 13:2:3 -getdate"
ON_THAT_DAY = {"date -u +%F": "2031-03-07\n", "cat /sys/class/rtc/rtc0/date": "2031-03-07\n"}

CHECKS = [
    Check("date and time are set, the hardware clock follows", needs=CLOCK, do=SET, kept=True,
          prints=re.compile(r"(?s).*setdate: 03/07/2031\nSet Time: 13:02:03\nDate: 3/7/2031\n"),
          errors=re.compile("(?s)(?!.*Time: read back).*"), then=ON_THAT_DAY),
    Check("the clock is at that time in its zone", needs=CLOCK, do=SET + " -gettime",
          prints=re.compile(r"(?s).*Time: 13:02:0[3-9]\n"),
          then={"date -u +%H:%M": "07:32\n", "cut -c1-5 /sys/class/rtc/rtc0/time": "07:32\n"}),
    Check("a year that the kernel refuses is told, and leaves the clock", needs=CLOCK,
          do="TAVISK_LOG=stderr tavisk -setdate 1/1/1950", prints="setdate: 01/01/1950\n",
          errors=re.compile(r"tavisk: Time: .*\n"), then=ON_THAT_DAY),
    Check("a clock that is another machine's is told", needs=frozenset({"container"}),
          do="TAVISK_LOG=stderr tavisk -setusingnetworktime off -settime 1:2:3",
          prints=re.compile(r"[^\n]*[Oo]ff\.?\nSet Time: 01:02:03\n"),
          errors=re.compile(r"(tavisk: Network Time At Startup: disable on .*\n)?tavisk: Time: .*CAP_SYS_TIME.*\n"),
          then={"journalctl -b -t tavisk TAVISK_SETTING=Time -n 1 -o cat": re.compile(r"Time: failed, .*CAP_SYS_TIME.*\n")}),
]

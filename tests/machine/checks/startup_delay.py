# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check
from checks.sleep_timers import reported, reporting

SERVER = frozenset({"server"})
GET, SET = "getwaitforstartupafterpowerfailure", "setwaitforstartupafterpowerfailure"


def kept(seconds):
    return {"controller tells": re.compile(f"policy \\d, delay {seconds}\n"), f"tavisk -{GET}": f"{GET}: {seconds} seconds\n"}


CHECKS = [
    Check("the longest delay", needs=SERVER, do=f"tavisk -{SET} 7650", prints=f"{SET}: 7650 seconds\n", then=kept(7650)),
    Check("a delay that the controller cannot keep is a failure in the record", needs=SERVER, do=reporting(f"-{SET} 999990"),
          prints=f"{SET}: 999990 seconds\n",
          errors="tavisk: Startup Delay: read back on Startup Delay: reads 53\n",
          then=kept(1590) | reported('"outcome":"failed"', '"asked":"33333","live":"53"', '"changed":true')),
    Check("a delay that is no number is refused in the record, and none", needs=SERVER, do=reporting(f"-{SET} soon"),
          prints=f"{SET}: 0 seconds\n", errors="", then=kept(0) | reported('"refused":')),
    Check("a delay is kept in the controller", needs=SERVER, kept=True, do=f"tavisk -{SET} 90",
          prints=f"{SET}: 90 seconds\n", then=kept(90)),
] + [
    Check(f"a {name} without a controller has no delay", needs=frozenset({name}), do=reporting(f"-{GET} -{SET} 30"),
          prints=f"{GET}: 0 seconds\nsetWaitForStartupAfterPowerFailure: Error, IOServiceOpen returned 0x13\n",
          errors=re.compile(r"tavisk: Startup Delay: find on the management controller: this machine has none[^\n]*\n"),
          then=reported('"supported":false', '"outcome":"not supported"'))
    for name in ("container", "guest")
]

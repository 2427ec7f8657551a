# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

SERVER = frozenset({"server"})
GET, SET = "getwaitforstartupafterpowerfailure", "setwaitforstartupafterpowerfailure"


def kept(seconds):
    return {"controller tells": re.compile(f"policy \\d, delay {seconds}\n"), f"tavisk -{GET}": f"{GET}: {seconds} seconds\n"}


CHECKS = [
    Check("the longest delay", needs=SERVER, do=f"tavisk -{SET} 7650", prints=f"{SET}: 7650 seconds\n", then=kept(7650)),
    Check("a delay is kept in the controller", needs=SERVER, kept=True, do=f"tavisk -{SET} 90",
          prints=f"{SET}: 90 seconds\n", then=kept(90)),
] + [
    Check(f"a {name} without a controller has no delay", needs=frozenset({name}), do=f"tavisk -{GET} -{SET} 30",
          prints=f"{GET}: 0 seconds\nsetWaitForStartupAfterPowerFailure: Error, IOServiceOpen returned 0x13\n")
    for name in ("container", "guest")
]

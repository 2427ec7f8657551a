# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Keeps the machine that runs the tests from being changed by them."""

import os
import time

CAP_SYS_TIME = 1 << 25
CAPABILITY_SETS = ("CapInh", "CapPrm", "CapEff", "CapBnd", "CapAmb")


class Unsafe(Exception):
    pass


def _holds_clock(pid):
    with open(f"/proc/{pid}/status") as status:
        sets = dict(line.split(":\t", 1) for line in status if line.startswith("Cap"))
    return any(int(sets[name], 16) & CAP_SYS_TIME for name in CAPABILITY_SETS)


def _can_set_clock():
    try:
        time.clock_settime(time.CLOCK_REALTIME, time.clock_gettime(time.CLOCK_REALTIME))
    except PermissionError:
        return False
    return True


def refuse_unless_isolated():
    """Raises Unsafe when this process could set the clock, or shares mounts or the host name with who started it."""
    outer = os.environ.get("TAVISK_OUTER_SPACES", "").split()
    own = [os.readlink("/proc/self/ns/" + space) for space in ("mnt", "uts")]
    if len(outer) != 2 or set(outer) & set(own):
        raise Unsafe("start the machines by script/test-machine: mounts and host name are shared here")
    if _holds_clock("self") or _can_set_clock():
        raise Unsafe("the tests could set the clock of this machine")


def refuse_unless_contained(pid):
    """The same for a container, by its first process."""
    if _holds_clock(pid):
        raise Unsafe("the container could set the clock of this machine")
    if os.readlink(f"/proc/{pid}/ns/uts") == os.readlink("/proc/self/ns/uts"):
        raise Unsafe("the container shares the host name of this machine")

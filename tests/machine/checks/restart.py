# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CONTAINER, GUEST, SERVER = frozenset({"container"}), frozenset({"guest"}), frozenset({"server"})
KEPT = "controller tells"
WATCHDOG = ("busctl get-property org.freedesktop.systemd1 /org/freedesktop/systemd1 org.freedesktop.systemd1.Manager "
            "RuntimeWatchdogUSec")


def policy(number):
    return {KEPT: re.compile(f"policy {number}, delay \\d+\n")}


def freeze(watchdog, state, panic):
    return {WATCHDOG: f"t {watchdog * 1_000_000}\n", "sysctl -n kernel.panic": f"{panic}\n",
            "cat /sys/class/watchdog/watchdog0/state": f"{state}\n"}


CHECKS = [
    Check("the management controller keeps the machine off", needs=SERVER,
          do="tavisk -setrestartpowerfailure off -getrestartpowerfailure",
          prints="setrestartpowerfailure: Off\nRestart After Power Failure: Off\n", then=policy(0)),
    Check("the management controller turns the machine on", needs=SERVER, kept=True,
          do="tavisk -setrestartpowerfailure on -getrestartpowerfailure",
          prints="setrestartpowerfailure: On\nRestart After Power Failure: On\n", then=policy(2)),
    Check("a machine without a controller says so", needs=CONTAINER, status=1,
          do="tavisk -getrestartpowerfailure -setrestartpowerfailure on",
          prints=2 * "Restart After Power Failure: Not supported on this machine.\n"),
    Check("a machine that hangs stays so", needs=SERVER, do="tavisk -setrestartfreeze off -getrestartfreeze",
          prints="Restart After Freeze: Off\n", then=freeze(0, "inactive", 0)),
    Check("a machine that hangs restarts", needs=SERVER, kept=True,
          do="TAVISK_LOG=stderr tavisk -setrestartfreeze on -getrestartfreeze", errors="",
          prints="Restart After Freeze: On\n",
          then=freeze(60, "active", 10) | {"tavisk -getrestartfreeze": "Restart After Freeze: On\n"}),
    Check("without services a kernel that panics restarts", needs=GUEST,
          do="tavisk -setrestartfreeze on -getrestartfreeze", prints="Restart After Freeze: On\n",
          then={"cat /proc/sys/kernel/panic": "10\n"}),
    Check("a container cannot set the kernel", needs=CONTAINER,
          do="TAVISK_LOG=stderr tavisk -setrestartfreeze on -getrestartfreeze; "
             "rm /etc/sysctl.d/60-tavisk.conf /etc/systemd/system.conf.d/60-tavisk.conf",
          prints=re.compile("Restart After Freeze: (On|Off)\n"),  # as the machine that hosts it has it
          errors=re.compile(r"tavisk: Restart After Freeze: [^\n]* on /proc/sys/kernel/panic: Read-only file system\n")),
]

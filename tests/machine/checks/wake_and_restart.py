# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check
from checks.sleep_timers import LOGIN, idle

CONTAINER, GUEST, SERVER = frozenset({"container"}), frozenset({"guest"}), frozenset({"server"})
NOT_HERE = "Not supported on this machine.\n"
# What wakes each card: "g" is a magic packet, "d" nothing.
CARDS = "for card in /sys/class/net/eth*; do ethtool ${card##*/} | sed -n 's/^\\tWake-on: //p' | grep . || echo none; done"
PORT = "cat /sys/class/tty/ttyS0/device/power/wakeup"
KEPT = "controller tells"
WATCHDOG = ("busctl get-property org.freedesktop.systemd1 /org/freedesktop/systemd1 org.freedesktop.systemd1.Manager "
            "RuntimeWatchdogUSec")


def policy(number):
    return {KEPT: re.compile(f"policy {number}, delay \\d+\n")}


def freeze(watchdog, state, panic):
    return {WATCHDOG: f"t {watchdog * 1_000_000}\n", "sysctl -n kernel.panic": f"{panic}\n",
            "cat /sys/class/watchdog/watchdog0/state": f"{state}\n"}


CHECKS = [
    Check("the one card that can wakes the machine", needs=GUEST,
          do="tavisk -setwakeonnetworkaccess on -getwakeonnetworkaccess",
          prints="setwakeonnetworkaccess: On\nWake On Network Access: On\n", then={CARDS: "g\nd\nd\nd\nnone\n"}),
    Check("no card wakes it", needs=GUEST, do="tavisk -setwakeonnetworkaccess off -getwakeonnetworkaccess",
          prints="setwakeonnetworkaccess: Off\nWake On Network Access: Off\n", then={CARDS: "d\nd\nd\nd\nnone\n"}),
    Check("the serial port that can wakes the machine", needs=GUEST,
          do="tavisk -setwakeonmodem on -getwakeonmodem", prints="setwakeonmodem: On\nWake On Modem: On\n",
          then={PORT: "enabled\n"}),
    Check("no serial port wakes it", needs=GUEST, do="tavisk -setwakeonmodem off -getwakeonmodem",
          prints="setwakeonmodem: Off\nWake On Modem: Off\n", then={PORT: "disabled\n"}),
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
    Check("the power button sleeps", needs=SERVER, kept=True,
          do="tavisk -setallowpowerbuttontosleepcomputer off -getallowpowerbuttontosleepcomputer "
             "-setallowpowerbuttontosleepcomputer on",
          prints="setallowpowerbuttontosleepcomputer: Off\ngetAllowPowerButtonToSleepComputer: Off\n"
                 "setallowpowerbuttontosleepcomputer: On\n",
          then={LOGIN + "HandlePowerKey": 's "suspend"\n',
                "tavisk -getallowpowerbuttontosleepcomputer": "getAllowPowerButtonToSleepComputer: On\n"} |
               idle("suspend", 170)),
] + [
    Check(f"nothing wakes this {name}", needs=needs, status=1,
          do="tavisk -getwakeonmodem -getwakeonnetworkaccess -setwakeonnetworkaccess on -setwakeonmodem on",
          prints="Wake On Modem: " + NOT_HERE + 2 * ("Wake On Network Access: " + NOT_HERE) + "Wake On Modem: " + NOT_HERE)
    for name, needs in (("container", CONTAINER), ("server", SERVER))
]

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check
from checks.sleep_timers import LOGIN, idle, reported, reporting

CONTAINER, GUEST, SERVER = frozenset({"container"}), frozenset({"guest"}), frozenset({"server"})
NOT_HERE = "Not supported on this machine.\n"
# What wakes each card: "g" is a magic packet, "d" nothing.
CARDS = "for card in /sys/class/net/eth*; do ethtool ${card##*/} | sed -n 's/^\\tWake-on: //p' | grep . || echo none; done"
# Since Linux 6.6 there are two more devices between the port and its place on the board.
PORT = ("cd -P /sys/class/tty/ttyS0/device; until [ $(basename $(readlink subsystem)) = pnp ]; do cd ..; done; "
        "cat power/wakeup")
KEPT = "controller tells"
PANIC = "/etc/sysctl.d/60-tavisk.conf"
ADMIN, LATER = "/etc/sysctl.d/50-admin.conf", "/etc/sysctl.d/70-other.conf"
BUTTON = "/etc/systemd/logind.conf.d/70-other.conf"
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
    Check("a machine that hangs stays so", needs=SERVER,
          do=f"rm -f {ADMIN}; tavisk -setrestartfreeze off -getrestartfreeze",
          prints="Restart After Freeze: Off\n", then=freeze(0, "inactive", 0)),
    Check("a file that hides it leaves all as it was", needs=SERVER,
          do=f"echo 'kernel.panic = 0' >{LATER}; {reporting('-setrestartfreeze on -getrestartfreeze')}; rm {LATER}",
          prints="Restart After Freeze: Off\n",
          errors=re.compile(f"tavisk: Restart After Freeze: write on {PANIC}: {LATER} says otherwise[^\\n]*\\n"),
          then=freeze(0, "inactive", 0) | reported('"changed":false,"values":[],"effects":[{', f'"undoneBy":"{LATER}"') |
               {f"test -e {PANIC} || echo gone": "gone\n"}),
    Check("a machine that hangs restarts", needs=SERVER,
          do="TAVISK_LOG=stderr tavisk -setrestartfreeze on -getrestartfreeze", errors="",
          prints="Restart After Freeze: On\n",
          then=freeze(60, "active", 10) | {"tavisk -getrestartfreeze": "Restart After Freeze: On\n"}),
    Check("an administrator's own kernel.panic stays", needs=SERVER, kept=True,
          do=f"tavisk -setrestartfreeze off; echo 'kernel.panic = 5' >{ADMIN}; sysctl -q -p {ADMIN}; " +
             reporting("-setrestartfreeze on -getrestartfreeze") + f"; grep -c {PANIC} /run/report || :", errors="",
          prints="Restart After Freeze: On\n0\n",
          then=freeze(60, "active", 5) | {f"test -e {PANIC} || echo gone": "gone\n",
                                          "tavisk -getrestartfreeze": "Restart After Freeze: On\n"}),
    Check("a container cannot have its kernel restart", needs=CONTAINER, do=reporting("-setrestartfreeze on"), prints="",
          errors=re.compile(r"tavisk: Restart After Freeze: [^\n]*read-only[^\n]*\n"),
          then=reported('"changed":false', '"outcome":"not supported"') | {f"test -e {PANIC} || echo gone": "gone\n"}),
    Check("without services a kernel that panics restarts", needs=GUEST,
          do="tavisk -setrestartfreeze on -getrestartfreeze", prints="Restart After Freeze: On\n",
          then={"cat /proc/sys/kernel/panic": "10\n"}),
    Check("a power button that another file keeps off", needs=SERVER,
          do=f"tavisk -setallowpowerbuttontosleepcomputer off; printf '[Login]\\nHandlePowerKey=ignore\\n' >{BUTTON}; " +
             reporting("-setallowpowerbuttontosleepcomputer on") + f"; rm {BUTTON}",
          prints="setallowpowerbuttontosleepcomputer: Off\nsetallowpowerbuttontosleepcomputer: On\n",
          errors=re.compile(rf"tavisk: Power Button Sleep: write on [^\n]*: {BUTTON} says otherwise[^\n]*\n"),
          then={LOGIN + "HandlePowerKey": 's "poweroff"\n'} | reported('"changed":false')),
    Check("a login service that another run restarts is asked again", needs=SERVER,
          do="(for minutes in 20 40 20 170; do systemctl reset-failed systemd-logind; tavisk -setcomputersleep $minutes; done) "
             ">/dev/null & for word in off on off on off on; do TAVISK_LOG=stderr tavisk -setallowpowerbuttontosleepcomputer $word; "
             "done >/dev/null; wait", errors=""),
    Check("the power button sleeps", needs=SERVER, kept=True,
          do="tavisk -setallowpowerbuttontosleepcomputer off -getallowpowerbuttontosleepcomputer "
             "-setallowpowerbuttontosleepcomputer on",
          prints="setallowpowerbuttontosleepcomputer: Off\ngetAllowPowerButtonToSleepComputer: Off\n"
                 "setallowpowerbuttontosleepcomputer: On\n",
          then={LOGIN + "HandlePowerKey": 's "suspend"\n',
                "tavisk -getallowpowerbuttontosleepcomputer": "getAllowPowerButtonToSleepComputer: On\n"} |
               idle("suspend", 170)),
] + [
    Check(f"what can wakes the guest, or does not: {setting} {word}", needs=GUEST, do=f"tavisk -set{setting} {word} -get{setting}",
          prints=f"set{setting}: {word.title()}\n{title}: {word.title()}\n", then={seen: expected})
    for setting, title, word, seen, expected in (
        ("wakeonnetworkaccess", "Wake On Network Access", "on", CARDS, "g\nd\nd\nd\nnone\n"),
        ("wakeonnetworkaccess", "Wake On Network Access", "off", CARDS, "d\nd\nd\nd\nnone\n"),
        ("wakeonmodem", "Wake On Modem", "on", PORT, "enabled\n"),
        ("wakeonmodem", "Wake On Modem", "off", PORT, "disabled\n"))
] + [
    Check(f"nothing wakes this {name}", needs=needs, status=1,
          do=reporting("-getwakeonmodem -getwakeonnetworkaccess -setwakeonnetworkaccess on -setwakeonmodem on"),
          prints="Wake On Modem: " + NOT_HERE + 2 * ("Wake On Network Access: " + NOT_HERE) + "Wake On Modem: " + NOT_HERE,
          errors=re.compile(r"tavisk: Wake On Network Access: [^\n]*\ntavisk: Wake On Modem: [^\n]*\n"),
          then={"grep -c '\"supported\":false.*\"effects\":\\[\\]' /run/report": "2\n",
                "grep -c '\"outcome\":\"not supported\"' /run/report": "2\n"})
    for name, needs in (("container", CONTAINER), ("server", SERVER))
]

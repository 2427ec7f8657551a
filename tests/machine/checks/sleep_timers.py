# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CONTAINER, GUEST, SERVER = frozenset({"container"}), frozenset({"guest"}), frozenset({"server"})
OURS, THEIRS = "/etc/systemd/logind.conf.d/60-tavisk.conf", "/etc/systemd/logind.conf.d/70-other.conf"
BLANKING_RULES = "/etc/tmpfiles.d/50-other.conf"
IDLE_WARNING = re.compile(r"tavisk: Computer Sleep: warning: [^\n]* counts as idle[^\n]*\n")
LOGIN = "busctl get-property org.freedesktop.login1 /org/freedesktop/login1 org.freedesktop.login1.Manager "
BLANKING = "cat /sys/module/kernel/parameters/consoleblank"
# The disk with a motor, then the one without.
# The kernel names the two disks in the order in which they answer.
MOTOR, OTHER = (f"$(grep -lx {turns} /sys/block/sd[ab]/queue/rotational | cut -d/ -f-4)" for turns in (1, 0))
DISKS = f"cat {MOTOR}/device/power/control {OTHER}/device/power/control {MOTOR}/device/power/autosuspend_delay_ms"


def idle(action, minutes):
    return {LOGIN + "IdleAction": f's "{action}"\n', LOGIN + "IdleActionUSec": f"t {minutes * 60_000_000}\n"}


def reporting(command):
    """With what it records in /run/report."""
    return f"rm -f /run/report; TAVISK_LOG=stderr TAVISK_REPORT=/run/report tavisk {command}"


def reported(*texts):
    return {f"grep -c -F '{text}' /run/report": "1\n" for text in texts}


def timers(computer, display, disk):
    return "".join(f"Sleep: {what} sleeps {when}\n"
                   for what, when in (("Computer", computer), ("Display", display), ("Disk", disk)))


CHECKS = [
    Check("a container that cannot sleep says so", needs=CONTAINER,
          do="TAVISK_LOG=stderr tavisk -setsleep 20 -getsleep",
          prints="setsleep: 20 (computer, display, hard disk)\n" + timers("Never", "Never", "Never"),
          errors=re.compile(r"tavisk: Display Sleep: [^\n]*\ntavisk: Hard Disk Sleep: [^\n]*\n"
                            r"tavisk: Computer Sleep: [^\n]* cannot sleep\n"),
          then={LOGIN + "IdleAction": 's "ignore"\n', "ls /etc/systemd/logind.conf.d /etc/udev/rules.d 2>&1 | grep tavisk": ""}),
    Check("the console blanks without any service", needs=GUEST,
          do="tavisk -setdisplaysleep 10 -getdisplaysleep -getcomputersleep -getharddisksleep",
          prints="setdisplaysleep: 10\nDisplay Sleep: after 10 minutes\nComputer Sleep: Never\nHard Disk Sleep: Never\n",
          then={BLANKING: "600\n"}),
    Check("sleep timers are set at the login service, the console and the disk with a motor", needs=SERVER,
          do="TAVISK_LOG=stderr tavisk -setsleep 150 -getsleep", errors=IDLE_WARNING,
          prints="setsleep: 150 (computer, display, hard disk)\n" +
                 timers("after 150 minutes", "after 60 minutes", "after 150 minutes"),
          then=idle("suspend", 150) | {BLANKING: "3600\n", DISKS: "auto\non\n9000000\n"}),
    Check("they never sleep", needs=SERVER, do="tavisk -setsleep never -getsleep",
          prints="setsleep: Never (computer, display, hard disk)\n" + timers("Never", "Never", "Never"),
          then={LOGIN + "IdleAction": 's "ignore"\n', BLANKING: "0\n", DISKS: "on\non\n9000000\n"}),
    Check("a timer that another file hides changes nothing, and names that file", needs=SERVER,
          do="tavisk -setcomputersleep 20; "
             f"printf '[Login]\\nIdleAction=ignore\\n' >{THEIRS}; " + reporting("-setcomputersleep 30"),
          prints="setcomputersleep: 20\nsetcomputersleep: 30\n",
          errors=re.compile(rf"tavisk: Computer Sleep: write on {OURS}: {THEIRS} says otherwise[^\n]*\n"),
          then=idle("suspend", 20) | {f"grep ^Idle {OURS}": "IdleAction=suspend\nIdleActionSec=20min\n"} |
               reported('"changed":false', f'"stored":"0, while 20 waits in {OURS}"', f'"undoneBy":"{THEIRS}"')),
    Check("never takes out what waits behind another file", needs=SERVER,
          do=reporting("-setcomputersleep never") + f"; rm {THEIRS}; systemctl restart systemd-logind; tavisk -getcomputersleep",
          prints="setcomputersleep: Never\nComputer Sleep: Never\n", errors="",
          then={LOGIN + "IdleAction": 's "ignore"\n', f"grep ^IdleAction= {OURS}": "IdleAction=ignore\n"} |
               reported('"outcome":"applied"', f'"where":"{OURS}"')),
    Check("of two files for the console the first one counts", needs=SERVER,
          do=f"tavisk -setdisplaysleep 20; printf 'w /dev/tty1 - - - - \\\\033[9;5]\\n' >{BLANKING_RULES}; " +
             reporting("-setdisplaysleep 30 -getdisplaysleep") +
             "; systemd-tmpfiles --create --prefix=/dev/tty1 2>/dev/null; cat /sys/module/kernel/parameters/consoleblank; "
             f"rm {BLANKING_RULES}; systemd-tmpfiles --create --prefix=/dev/tty1 2>/dev/null; true",
          prints="setdisplaysleep: 20\nsetdisplaysleep: 30\nDisplay Sleep: after 20 minutes\n300\n",
          errors=re.compile(rf"tavisk: Display Sleep: write on [^\n]*: {BLANKING_RULES} says otherwise[^\n]*\n"),
          then={BLANKING: "1200\n"}),
    Check("a container's report says what it cannot have", needs=CONTAINER, do=reporting("-getdisplaysleep -getharddisksleep"),
          prints="Display Sleep: Never\nHard Disk Sleep: Never\n", errors="",
          then={"grep -c '\"supported\":false.*\"effects\":\\[\\]' /run/report": "2\n"}),
    Check("each timer is kept by itself", needs=SERVER, kept=True,
          do="tavisk -setcomputersleep 170 -setdisplaysleep 20 -setharddisksleep 1",
          prints="setcomputersleep: 170\nsetdisplaysleep: 20\nsetharddisksleep: 1\n",
          then=idle("suspend", 170) | {
              BLANKING: "1200\n", DISKS: "auto\non\n60000\n",
              "tavisk -getsleep": timers("after 170 minutes", "after 20 minutes", "after 1 minutes")}),
    Check("an idle disk stops", needs=SERVER,
          do=f"timeout 100 sh -c 'until grep -q suspended {MOTOR}/device/power/runtime_status; do sleep 1; done' && "
             "dmesg | grep -c 'sd .*Stopping disk' | sed 's/[1-9].*/stopped/'", prints="stopped\n"),
    Check("a disk that comes back gets its timer", needs=SERVER,
          do=f"echo on >{MOTOR}/device/power/control; udevadm trigger --settle --action=add {MOTOR}",
          then={DISKS: "auto\non\n60000\n"}),
]

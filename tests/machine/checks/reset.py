# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check
from checks.network_time import SERVER, SERVERS_IN_USE
from checks.sleep_timers import LOGIN, idle

NEEDS = frozenset({"bus", "container"})
OURS, THEIRS = "/etc/systemd/logind.conf.d/60-tavisk.conf", "/etc/systemd/logind.conf.d/50-other.conf"
BOOT = "/Library/Preferences/SystemConfiguration/com.velmar.Boot.plist"
TABLE = r"Setting +Was +Is +Outcome\n"
GONE = {f"test -e {OURS} || echo gone": "gone\n"}
RESTART_LOGIN = "systemctl reset-failed systemd-logind; systemctl restart systemd-logind; "
# What a container lacks to sleep, in a tree that is laid over the kernel's.
CAN_SLEEP = """mkdir /run/sys; mount -t tmpfs tmpfs /run/sys
for part in /sys/*; do mkdir /run$part; [ $part = /sys/power ] || mount --rbind $part /run$part; done
mkdir -p /run/sys/power; echo 'freeze mem' >/run/sys/power/state; echo '[s2idle] deep' >/run/sys/power/mem_sleep
mount --rbind /run/sys /sys
""" + RESTART_LOGIN
AS_BEFORE = "status=$?; mount --make-rprivate /sys; umount -l /sys; mount --make-rprivate /run/sys; umount -l /run/sys; rmdir /run/sys; " + RESTART_LOGIN + "exit $status"
OWN_SERVERS = {"systemd-timesyncd": "/etc/systemd/timesyncd.conf.d/60-tavisk.conf",
               "chrony": "/etc/chrony/sources.d/60-tavisk.sources", "ntpsec": "/etc/ntpsec/ntp.d/60-tavisk.conf"}
PASSING = "192.0.2.99"


def back_to_others(daemon):
    """What is in use is asked until the daemon has come to read it."""
    used = f"{SERVERS_IN_USE[daemon]} 2>&1 | grep -q -F {PASSING}"
    return Check(f"{daemon} goes back to the servers of others", needs=NEEDS | {daemon},
                 do=f"tavisk -setnetworktimeserver {PASSING} >/dev/null; timeout 20 sh -c 'until {used}; do sleep 0.2; done'; "
                    f"taviskctl reset networktimeserver; test -e {OWN_SERVERS[daemon]} || echo gone; "
                    f"timeout 20 sh -c 'while {used}; do sleep 0.2; done' && echo no more; "
                    f"tavisk -setnetworktimeserver {SERVER} >/dev/null",
                 prints=re.compile(TABLE + rf"Network Time Server .* applied\n  no longer kept in {OWN_SERVERS[daemon]}\n"
                                   "gone\nno more\n"))


CHECKS = [
    Check("the other setting in a shared file stays", needs=NEEDS,
          do=CAN_SLEEP + f"rm -f {THEIRS}; tavisk -setcomputersleep 30 >/dev/null; echo HandlePowerKey=suspend >>{OURS}; "
             f"taviskctl reset computersleep; cat {OURS}; " + AS_BEFORE,
          prints=re.compile(TABLE + rf"Computer Sleep +30 minutes +never +applied\n  no longer kept in {OURS}\n"
                            r"# Written by .*\n\[Login\]\nHandlePowerKey=suspend\n"),
          then=idle("ignore", 30)),
    Check("what the machine cannot have goes too, and its file", needs=NEEDS, kept=True, then=GONE | {LOGIN + "IdleAction": 's "ignore"\n'},
          do="taviskctl reset allowpowerbuttontosleepcomputer",
          prints=re.compile(TABLE + rf"Power Button Sleep +- +- +applied\n  no longer kept in {OURS}\n  this machine cannot have .*\n")),
    Check("what an administrator has configured comes into force", needs=NEEDS,
          do=CAN_SLEEP + f"tavisk -setcomputersleep 30 >/dev/null; printf '[Login]\\nIdleAction=suspend\\nIdleActionSec=5min\\n' >{THEIRS}; "
             f"taviskctl reset computersleep; {LOGIN} IdleActionUSec; test -e {OURS} || echo gone; taviskctl reset computersleep; "
             f"rm {THEIRS}; " + AS_BEFORE,
          prints=re.compile(TABLE + rf"Computer Sleep +30 minutes +5 minutes +applied\n  no longer kept in {OURS}\nt 300000000\ngone\n" +
                            TABLE + r"Computer Sleep +5 minutes +5 minutes +unchanged\n  tavisk stores nothing of it\n"),
          then=GONE | {LOGIN + "IdleAction": 's "ignore"\n'}),
    Check("a reset is recorded, and taken back", needs=NEEDS,
          do=f"cp {BOOT} /run/boot.plist; tavisk -setkernelbootarchitecture i386 >/dev/null; taviskctl reset kernelarchitecture >/dev/null; "
             "journalctl --sync; journalctl -b -t tavisk TAVISK_SETTING='Kernel Architecture' TAVISK_OUTCOME=applied -n 1 -o cat; "
             f"grep -c Architecture {BOOT}; taviskctl undo --run; grep -c Architecture {BOOT}; cp /run/boot.plist {BOOT}",
          prints=re.compile('Kernel Architecture: applied, was "i386", asked "what the machine has without tavisk"\n0\n'
                            r"Setting +Was +Back to +Outcome\nKernel Architecture +default +i386 +applied\n1\n")),
    Check("what is the machine's own is told, and stays", needs=NEEDS, status=1,
          do="tavisk -gettimezone >/run/zone; taviskctl reset timezone remotelogin >/run/told; status=$?; "
             "grep -o 'not supported: reset: .*' /run/told; tavisk -gettimezone | cmp - /run/zone; exit $status",
          prints="not supported: reset: it is the machine's own value, in no file of tavisk's\n"
                 "not supported: reset: a service starts by links that its package makes as well, not by a file of tavisk's\n"),
    Check("who is nobody may not reset", needs=NEEDS, status=1,
          do="setpriv --reuid nobody --regid nogroup --clear-groups taviskctl reset kernelarchitecture",
          errors="taviskctl: run words of tavisk: not an administrator\n"),
] + [back_to_others(daemon) for daemon in OWN_SERVERS]

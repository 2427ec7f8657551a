# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Each set command that keeps its value in files, in a container: with faults, at the same moment, and while another waits."""

import concurrent.futures
import hashlib
import json
import pathlib
import re
import sys
import time

import container
import trees

sys.path.append(str(pathlib.Path(__file__).parents[1] / "faults"))
import injection  # noqa: E402
from injection import Command  # noqa: E402

BOOT = "/Library/Preferences/SystemConfiguration/com.velmar.Boot.plist"
PREFERENCES = "/etc/tavisk/preferences/AnyApplication.plist"
OTHER_KEYS = "<dict><key>Timeout</key><integer>5</integer><key>Kernel</key><data>AP8=</data></dict>"
# What the machine lacks, and lines of others in each file that is shared.
EQUIP = rf"""set -e
mkdir -p /etc/systemd/system/service.d /etc/systemd/logind.conf.d
printf '[Unit]\nStartLimitIntervalSec=0\n' >/etc/systemd/system/service.d/test.conf
systemctl daemon-reload
systemctl stop systemd-timesyncd
mkdir /run/sys; mount -t tmpfs tmpfs /run/sys
for part in /sys/*; do
  mkdir /run$part
  case $part in */block | */bus | */module | */power) ;; *) mount --rbind $part /run$part ;; esac
done
cd /run/sys
mkdir -p power bus/acpi/devices/LNXPWRBN:00 module/kernel/parameters
mkdir -p block/sda/queue block/sda/device/power block/sda/device/scsi_disk/0:0:0:0
echo 'freeze mem' >power/state; echo '[s2idle] deep' >power/mem_sleep; echo 600 >module/kernel/parameters/consoleblank
echo 0 >block/sda/removable; echo 1 >block/sda/queue/rotational; echo 1 >block/sda/device/scsi_disk/0:0:0:0/manage_start_stop
echo on >block/sda/device/power/control; echo 0 >block/sda/device/power/autosuspend_delay_ms
cd /; mount --rbind /run/sys /sys
mkdir -p /run/udev; : >/run/udev/control
: >/dev/tty1
echo 0 >/run/panic; mount --bind /run/panic /proc/sys/kernel/panic
systemctl restart systemd-logind
printf '127.0.0.1\tlocalhost\n127.0.1.1\told-name\n192.0.2.1 other # kept\n' >/etc/hosts
printf '# kept\nCHASSIS=server\nPRETTY_HOSTNAME=Old\n' >/etc/machine-info
mkdir -p {pathlib.Path(BOOT).parent} {pathlib.Path(PREFERENCES).parent}
printf '%s' '{OTHER_KEYS}' | tee {BOOT} >{PREFERENCES}
tavisk -setcomputersleep 30 -setallowpowerbuttontosleepcomputer on
"""
# These need nothing that a container lacks.
PLAIN = [
    Command("kernelbootarchitecture", "i386", "x86_64", get="-getkernelbootarchitecturesetting", reset="kernelarchitecture"),
    Command("disablekeyboardwhenenclosurelockisengaged", "no", "yes", reset="keyboardlockpreference"),
    Command("computername", "Old", "New"),
]
COMMANDS = [
    Command("networktimeserver", "192.0.2.1", "192.0.2.2", reset="networktimeserver"),
    Command("localsubnetname", "old-name", "new-name"),
    Command("displaysleep", "5", "10", reset="displaysleep"),
    Command("harddisksleep", "never", "10", reset="harddisksleep"),
    Command("restartfreeze", "off", "on", reset="restartafterfreeze"),
    Command("allowpowerbuttontosleepcomputer", "off", "on", reset="powerbuttonsleep"),
    Command("computersleep", "20", "40", slow=True, reset="computersleep"),
    Command("remotelogin", "off", "on", slow=True),
    *PLAIN,
    Command("timezone", "Europe/Paris", "Asia/Tokyo"),
]
PAIRS = 250  # of each kind
# What two runs set at the same moment: a setting and its values, one after the other.
AT_ONCE = [
    (("computersleep", "20", "40"), ("allowpowerbuttontosleepcomputer", "off", "on")),
    (("timezone", "Europe/Paris", "Asia/Tokyo"), ("timezone", "America/Lima", "Asia/Kolkata")),
    (("localsubnetname", "one", "two"), ("localsubnetname", "three", "four")),
    (("kernelbootarchitecture", "i386", "x86_64"), ("disablekeyboardwhenenclosurelockisengaged", "yes", "no")),
]
HOLD = "exec 9<>/run/tavisk/lock; flock 9; echo $$$$ | tee /run/tavisk/lock; exec sleep 20"  # systemd-run makes $$ of it
WAITS = "TAVISK_LOG=stderr tavisk -setcomputername Late"
# Asked for a password that nobody can give: refused before the lock is taken.
REFUSED = "TAVISK_LOG=stderr setpriv --reuid alice --regid alice --init-groups tavisk -setcomputername Late"


class Inside(injection.Place):
    def __init__(self, process, work="/run/faults"):
        super().__init__(["nsenter", "--target", process, "--all", "env", "-i", "PATH=/usr/sbin:/usr/bin:/sbin:/bin"], "tavisk",
                         f"/proc/{process}/root", work, ["/etc", "/Library", "/var/lib/tavisk", "/run/tavisk"])

    def plain(self, contents, path):
        """The lock tells who had it last."""
        return b"" if path == "/run/tavisk/lock" else contents


def wrong_at_once(places, words, right):
    """What is wrong after two runs at the same moment: the outcome is to be as if one came after the other."""
    with concurrent.futures.ThreadPoolExecutor() as at_once:
        list(at_once.map(injection.Place.run, places, words))
    state = places[0].state()
    failed = [entry for place in places for entry in place.report() or ["no report"]
              if entry == "no report" or any(effect["outcome"] == "failed" for effect in entry["effects"])]
    paths = sorted(path for after in right for path in state | after if state.get(path) != after.get(path))
    return failed + ([] if state in right else paths)


def after(places, words, order):
    for one in order:
        places[one].run(words[one])
    return places[0].state()


class FewFaults(container.Container):
    """A container as others are, with the quick form at the end."""

    def __init__(self, *packages):
        super().__init__(*packages, "strace")

    def prove_more(self, results):
        for command in PLAIN:
            self.sweep(command, results, choose=injection.few_of)
        self.prove_resets(PLAIN, results)

    def prove_resets(self, commands, results):
        for command in (command for command in commands if command.reset):
            runs, wrong = injection.wrong_resets(Inside(self._first_process), command)
            results.add(f"{self.name}: {command.reset} reset, killed {runs} times", wrong[:5])

    def sweep(self, command, results, **how):
        began = time.monotonic()
        try:
            runs, found = injection.sweep(Inside(self._first_process), command, **how)
        except ValueError as trouble:
            runs, found = 0, {"nothing to see": [str(trouble)]}
        results.add(f"{self.name}: {command.setting}, {runs} runs with a fault, {time.monotonic() - began:.0f} s",
                    [f"{kind}: {len(details)} times: {detail}" for kind, details in found.items() for detail in details[:3]])


class Faults(FewFaults):
    """All faults. Goes on where it was ended, until the package is another one."""
    own = frozenset({"faults"})

    def __init__(self):
        super().__init__("systemd-timesyncd", "openssh-server")
        self.name, self.has = "container with faults", self.own
        self._done = trees.CACHE / f"faults-{hashlib.sha256(trees.package().read_bytes()).hexdigest()[:16]}"

    def restart(self):
        """Nothing was changed yet."""

    def prove_more(self, results):
        equipped = self.run(EQUIP)
        results.add("faults: the container is equipped", [equipped.errors] if equipped.status else [])
        self._prove_that_who_waits_is_told(results)
        for pair in AT_ONCE:
            self._prove_two_at_once(pair, results)
        self.prove_resets(COMMANDS, results)
        self._done.touch()
        done = [json.loads(line) for line in self._done.read_text().splitlines()]
        with open(self._done, "a", buffering=1) as file:
            for command in COMMANDS:
                self.sweep(command, results, done=[told[1:] for told in done if told[0] == command.setting],
                           tell=lambda *told, setting=command.setting: print(json.dumps([setting, *told]), file=file))

    def _prove_two_at_once(self, pair, results):
        places = [Inside(self._first_process, f"/run/faults/{number}") for number in (1, 2)]
        turns = [[["-set" + setting, values[turn]] for setting, *values in pair] for turn in (0, 1)]
        right = [[after(places, words, order) for order in ((0, 1), (1, 0))] for words in turns]
        lost = [wrong for turn in range(PAIRS) if (wrong := wrong_at_once(places, turns[turn % 2], right[turn % 2]))]
        results.add(f"at once: {pair[0][0]} and {pair[1][0]}, {PAIRS} pairs, {len(lost)} lost", [str(wrong) for wrong in lost[:5]])

    def _prove_that_who_waits_is_told(self, results):
        """Who only looks, or may not change anything, does not wait."""
        with concurrent.futures.ThreadPoolExecutor() as at_once:
            held = at_once.submit(self.run, HOLD)
            time.sleep(1)
            began = time.monotonic()
            waiting = at_once.submit(self.run, WAITS)
            looked, refused = self.run("tavisk -getcomputername"), self.run(REFUSED)
            problems = [] if looked.status == 0 and time.monotonic() - began < 5 else ["who only looks waits"]
            answer = waiting.result()
            waited = time.monotonic() - began
        holder = held.result().output.strip()
        expected = re.compile(rf"tavisk: Computer Name: lock [^\n]*: process {holder} is changing [^\n]*\n")
        problems += [] if expected.search(answer.errors) else [answer.errors or answer.output]
        problems += [] if "authorize on org.tavisk.manage" in refused.errors else [refused.errors]
        results.add("at once: who waits is told for whom", problems + ([] if 14 < waited < 18 else [f"{waited} s"]))

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Each set command that keeps its value in files, in a container: with faults, at the same moment, and while another waits."""

import hashlib
import json
import pathlib
import subprocess
import sys
import threading
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
: >/dev/tty1
echo 0 >/run/panic; mount --bind /run/panic /proc/sys/kernel/panic
systemctl restart systemd-logind
printf '127.0.0.1\tlocalhost\n127.0.1.1\told-name\n192.0.2.1 other # kept\n' >/etc/hosts
printf '# kept\nCHASSIS=server\nPRETTY_HOSTNAME=Old\n' >/etc/machine-info
mkdir -p {pathlib.Path(BOOT).parent} {pathlib.Path(PREFERENCES).parent}
printf '%s' '{OTHER_KEYS}' | tee {BOOT} >{PREFERENCES}
tavisk -setcomputersleep 30 -setallowpowerbuttontosleepcomputer on
"""
COMMANDS = [
    Command("kernelbootarchitecture", "i386", "x86_64", get="-getkernelbootarchitecturesetting"),
    Command("disablekeyboardwhenenclosurelockisengaged", "yes", "no"),
    Command("computername", "Old", "New"),
    Command("timezone", "Europe/Paris", "Asia/Tokyo"),
    Command("networktimeserver", "192.0.2.1", "192.0.2.2"),
    Command("localsubnetname", "old-name", "new-name"),
    Command("displaysleep", "5", "10"),
    Command("harddisksleep", "never", "10"),
    Command("restartfreeze", "off", "on"),
    Command("allowpowerbuttontosleepcomputer", "off", "on"),
    Command("computersleep", "20", "40", slow=True),
    Command("remotelogin", "off", "on", slow=True),
]


class Inside(injection.Place):
    def __init__(self, process):
        self.process = process
        super().__init__(["nsenter", "--target", process, "--all", "env", "-i", "PATH=/usr/sbin:/usr/bin:/sbin:/bin"], "tavisk",
                         f"/proc/{process}/root", "/run/faults", ["/etc", "/Library", "/var/lib/tavisk", "/run/tavisk"])

    def plain(self, contents, path):
        """The lock tells who had it last."""
        return b"" if path == "/run/tavisk/lock" else contents


def prove(process, results):
    """The quick form, in any container."""
    for command in COMMANDS[:3]:
        found = {}
        injection.sweep(Inside(process), command, found, injection.few_of)
        results.add(f"faults: {command.setting}, {found.pop('runs', 0)} runs", _told(found))


def _told(found):
    return [f"{kind}: {len(details)} times: {detail}" for kind, details in found.items() for detail in details[:3]]


class Faults(container.Container):
    """Goes on where it was ended, until the package is another one."""
    own = frozenset({"faults"})

    def __init__(self):
        super().__init__("systemd-timesyncd", "openssh-server", "strace")
        self.name, self.has = "container with faults", self.own
        (package,) = pathlib.Path("dist").glob("tavisk_*.deb")
        self._done = trees.CACHE / f"faults-{hashlib.sha256(package.read_bytes()).hexdigest()[:16]}"

    def restart(self):
        """Nothing was changed yet."""

    def prove_more(self, results):
        equipped = self.run(EQUIP)
        results.add("faults: the container is equipped", [equipped.errors] if equipped.status else [])
        done = [json.loads(line) for line in self._done.read_text().splitlines()] if self._done.exists() else []
        for command in COMMANDS:
            self._sweep(command, results, [(fault, harm) for setting, fault, harm in done if setting == command.setting])

    def _sweep(self, command, results, done):
        found, began = {}, time.monotonic()
        with open(self._done, "a") as log:
            def tell(_, fault, harm):
                log.write(json.dumps([command.setting, fault, harm]) + "\n")
                log.flush()
            injection.sweep(Inside(self._first_process), command, found, seen={(command.setting, *fault) for fault, _ in done},
                        tell=tell)
        runs = found.pop("runs", 0) + len(done)
        for fault, harm in done:
            for kind, detail in [("did not come about", "")] if harm is None else harm:
                found.setdefault(kind, []).append(f"{command.setting}: {' '.join(map(str, fault))}: {detail}")
        results.add(f"faults: {command.setting}, {runs} runs, {time.monotonic() - began:.0f} s", _told(found))

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""How long commands take in a container, in turn with what administrators would type else; see script/bench."""

import dataclasses
import os
import pathlib
import platform

import container
import machine
import trees

RACE = pathlib.Path(__file__).with_name("race.c")
DOCUMENT = pathlib.Path("doc/performance.md")
FIRST_LINE = "## Measured"  # what follows it is written anew
TRUE = "/usr/bin/true"
LINES = 1_000_000
VOLUMES = (10, 10_000)
# A time daemon that needs no clock, a server for it, and no limit on how often a service is started.
EQUIP = """set -e
mkdir -p /etc/systemd/system/service.d /etc/systemd/system/systemd-timesyncd.service.d
printf '[Unit]\\nStartLimitIntervalSec=0\\n' >/etc/systemd/system/service.d/bench.conf
printf '[Unit]\\nConditionVirtualization=\\nConditionCapability=\\n[Service]\\nType=simple\\nExecStart=\\nExecStart=/usr/bin/sleep infinity\\n' \\
  >/etc/systemd/system/systemd-timesyncd.service.d/bench.conf
mkdir -p /etc/systemd/timesyncd.conf.d
printf '[Time]\\nNTP=192.0.2.1\\n' >/etc/systemd/timesyncd.conf.d/bench.conf
systemctl daemon-reload
systemctl stop avahi-daemon.socket avahi-daemon
systemctl enable --now ssh systemd-timesyncd
printf '127.0.0.1\\tlocalhost\\n127.0.1.1\\told-name\\n' >/etc/hosts
hostnamectl hostname old-name
"""


@dataclasses.dataclass(frozen=True)
class Pair:
    """A command and its peer, and how many times the peer's time it may take."""
    command: str
    peer: str
    most: float


# The commands of a group run in turn. A change is undone by one that follows, so that each has something to do.
def beside_true(*words):
    return [[Pair("tavisk " + word, TRUE, 1.6)] for word in words]


SWITCHES = [
    [Pair("tavisk -f -setremotelogin off", "systemctl disable --now ssh", 1),
     Pair("tavisk -setremotelogin on", "systemctl enable --now ssh", 1)],
    [Pair("tavisk -setusingnetworktime off", "timedatectl set-ntp false", 1),
     Pair("tavisk -setusingnetworktime on", "timedatectl set-ntp true", 1)],
]
GETTERS = [
    *beside_true("-version", "-getdate", "-gettime", "-gettimezone", "-getcomputername", "-getnetworktimeserver",
                 "-getkernelbootarchitecturesetting", "-getdisablekeyboardwhenenclosurelockisengaged"),
    [Pair("tavisk -getremotelogin", "systemctl is-enabled ssh", 0.5)],
    [Pair("tavisk -getusingnetworktime", "timedatectl show", 0.5)],
    [Pair("tavisk -getlocalsubnetname", "hostnamectl hostname", 0.5)],
    [Pair("tavisk -listtimezones", "timedatectl list-timezones", 0.25)],
]
SETS = [
    [Pair("tavisk -settimezone Europe/Paris", "timedatectl set-timezone Asia/Tokyo", 1)],
    [Pair("tavisk -setcomputername New", "hostnamectl --pretty hostname Old", 1)],
    [Pair("tavisk -setlocalsubnetname new-name", "hostnamectl hostname old-name", 1)],
]
EACH_GETTER = ("tavisk -getdate -gettime -gettimezone -getusingnetworktime -getnetworktimeserver -getsleep "
               "-getcomputersleep -getdisplaysleep -getharddisksleep -getwakeonmodem -getwakeonnetworkaccess "
               "-getrestartpowerfailure -getrestartfreeze -getallowpowerbuttontosleepcomputer -getremotelogin "
               "-getremotevelmarevents -getcomputername -getlocalsubnetname -getwaitforstartupafterpowerfailure "
               "-getdisablekeyboardwhenenclosurelockisengaged -getkernelbootarchitecturesetting")
PEERS = ["date +%m:%d:%y", "date +%H:%M:%S", "timedatectl show --property=Timezone", "timedatectl show --property=NTP",
         "systemctl is-active systemd-timesyncd", "systemctl is-enabled ssh", "hostnamectl --pretty", "hostnamectl hostname"]


@dataclasses.dataclass(frozen=True)
class Row:
    what: str
    took: str
    beside: str
    goal: str
    isMet: bool

    def __str__(self):
        return f"| {self.what} | {self.took} | {self.beside} | {self.goal} | {'met' if self.isMet else '**missed**'} |"


def milliseconds(microseconds):
    return f"{microseconds / 1000:.2f} ms"


class Bench(container.Container):
    def __init__(self, *packages):
        super().__init__("systemd-timesyncd", *packages)
        self.has -= {"bus"}  # what a purge leaves is checked elsewhere
        self._rows = []

    def prove(self, results):
        trees.run("gcc", "-O1", "-static", "-o", self._tree / "usr/local/bin/race", RACE)
        runs = int(os.environ.get("TAVISK_RUNS", "500"))
        self._measure_status(runs // 5)  # of a machine as it comes
        self._must(EQUIP)
        for group in GETTERS:
            self._compare(group, runs)
        for group in SETS + SWITCHES:
            self._compare(group, max(runs // 10, 10))
        self._compare_all_getters(runs // 5)
        self._measure_memory()
        self._measure_prompt()
        self._measure_volumes()
        self._measure_size()
        self._write()
        missed = [str(row) for row in self._rows if not row.isMet]
        results.add("goals", missed)

    def _must(self, command):
        answer = self.run(command)
        if answer.status != 0:
            raise machine.Trouble(f"{command}: {answer.errors}")
        return answer.output

    def _race(self, commands, runs):
        """(microseconds, KiB) of each command."""
        lines = "\n".join(commands)
        fields = [line.split() for line in self._must(f"race {runs} <<'END'\n{lines}\nEND\n").splitlines()]
        for command, (_, _, failures) in zip(commands, fields):
            if int(failures):
                raise machine.Trouble(f"{command}: failed {failures} of {runs} times")
        return [(float(time), int(size)) for time, size, _ in fields]

    def _compare(self, group, runs):
        commands = [pair.command for pair in group] + [pair.peer for pair in group]
        times = [time for time, _ in self._race(commands, runs)]
        for pair, took, peer in zip(group, times, times[len(group):]):
            self._rows.append(Row(f"`{pair.command}`", milliseconds(took), f"`{pair.peer}` {milliseconds(peer)}",
                                  f"{took / peer:.2f} of at most {pair.most:g} times", took <= pair.most * peer))

    def _compare_all_getters(self, runs):
        took, true, *peers = [time for time, _ in self._race([EACH_GETTER, TRUE, *PEERS], runs)]
        for peer, name, most in ((sum(peers), f"{len(PEERS)} peers", 0.1), (true, TRUE, 6)):
            self._rows.append(Row("21 getters in one run", milliseconds(took), f"`{name}` {milliseconds(peer)}",
                                  f"{took / peer:.2f} of at most {most:g} times", took <= most * peer))

    def _measure_status(self, runs):
        most = 20_000
        ((took, _),) = self._race(["taviskctl status"], runs)
        self._rows.append(Row("`taviskctl status`", milliseconds(took), "", f"at most {milliseconds(most)}", took <= most))

    def _measure_memory(self):
        for words, most in (("tavisk -gettimezone", 4), ("tavisk -getremotelogin", 8)):
            ((_, size),) = self._race([words], 10)
            self._rows.append(Row(f"`{words}`, resident", f"{size / 1024:.1f} MiB", "", f"at most {most} MiB", size <= most * 1024))

    def _measure_prompt(self):
        self._must("mkdir -p /run/scratch; echo '<dict/>' >/run/scratch/machine.plist; "
                   f"yes -- -gettimezone | head -n {LINES} >/run/lines; head -n 10000 /run/lines >/run/few-lines; "
                   "for lines in few-lines lines; do printf '#!/bin/sh\\nexec env TAVISK_HOST=scratch:/run/scratch tavisk </run/%s\\n' "
                   "$lines >/usr/local/bin/prompt-$lines; done; chmod +x /usr/local/bin/prompt-*")
        (_, few), (time, all_lines) = self._race(["prompt-few-lines", "prompt-lines"], 1)
        rate = LINES / time * 1_000_000
        self._rows.append(Row(f"prompt, {LINES} lines", f"{rate:,.0f} lines a second", "", "at least 300,000", rate >= 300_000))
        self._rows.append(Row(f"prompt, {LINES} lines, resident", f"{all_lines} KiB", f"10000 lines: {few} KiB",
                              "no more", all_lines <= few * 1.02))

    def _measure_volumes(self):
        few, many = (self._time_of_volumes(count) for count in VOLUMES)
        each = (many - few) / (VOLUMES[1] - VOLUMES[0])
        self._rows.append(Row(f"startup disks of {VOLUMES[1]} volumes, each", f"{each:.1f} microseconds", f"{VOLUMES[0]}: {milliseconds(few)}",
                              "at most 40", each <= 40))

    def _time_of_volumes(self, count):
        disks = "".join(f"<key>disk{number}s1</key><dict><key>Volume Name</key><string>V{number}</string>"
                        f"<key>Mount Point</key><string>/Volumes/V{number}</string></dict>" for number in range(count))
        folder = self._tree / f"srv/volumes-{count}"
        folder.mkdir()
        (folder / "machine.plist").write_text(f"<dict><key>Disks</key><dict>{disks}</dict></dict>")
        for number in range(count):
            (folder / f"root/Volumes/V{number}").mkdir(parents=True)
        script = self._tree / f"usr/local/bin/list-{count}"
        script.write_text(f"#!/bin/sh\nexec env TAVISK_HOST=scratch:/srv/volumes-{count} tavisk -liststartupdisks\n")
        script.chmod(0o755)
        ((time, _),) = self._race([script.name], 10)
        return time

    def _measure_size(self):
        size = (self._tree / "usr/bin/tavisk").stat().st_size
        self._rows.append(Row("program", f"{size / 1e6:.2f} MB", "", "at most 2.5 MB", size <= 2_500_000))

    def _write(self):
        kept = DOCUMENT.read_text().split(FIRST_LINE)[0] if DOCUMENT.exists() else ""
        table = "\n".join(str(row) for row in self._rows)
        load = " ".join(f"{value:.1f}" for value in os.getloadavg())
        DOCUMENT.parent.mkdir(exist_ok=True)
        DOCUMENT.write_text(f"""{kept}{FIRST_LINE}

By `script/bench`, in a booted Debian 12 container on {os.cpu_count()} cores ({platform.machine()}), load {load}. Each
time is the tenth percentile of runs in turn with the peer's.

| What | tavisk | beside | goal | |
|---|---|---|---|---|
{table}
""")
        print(table)

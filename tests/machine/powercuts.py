# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Sets on file systems that lose their power: what a set has answered for is there afterwards, and nothing is torn."""

import os
import pathlib
import random
import re
import subprocess
import time

import machine
import trees

CUTS = int(os.environ.get("TAVISK_CUTS", "100"))  # of each file system
MAKE = {"ext4": ["mkfs.ext4", "-q"], "xfs": ["mkfs.xfs", "-q"]}
KEPT = ["etc", "var/lib/tavisk"]
# What it sets, and where the number of the last one stands.
SETTINGS = {
    "computername": ("Server {}", "etc/machine-info", r"^PRETTY_HOSTNAME=\"?Server (\d+)\"?$"),
    "localsubnetname": ("server-{}", "etc/hostname", r"^server-(\d+)$"),
}
SETS = "\n".join(f"""rm -f /run/report; tavisk -set{setting} "{value.format('$number')}" >/dev/null
                 grep -q '"applied"' /run/report && echo {setting} $number""" for setting, (value, _, _) in SETTINGS.items())
WRITER = f"export TAVISK_REPORT=/run/report; number=0; while :; do number=$((number + 1))\n{SETS}\ndone"
WITHOUT_SYNC = "int fsync(int f) { return f < 0; } int fdatasync(int f) { return f < 0; } void sync(void) {} int syncfs(int f) { return f < 0; }"


class PowerCuts(machine.Machine):
    name = "file systems that lose their power"
    cannot = "lose what a disk keeps in a cache of its own"

    def __init__(self):
        self._tree = trees.layered("powercuts", [])
        self._pool = trees.WORK / "pool"
        self._writer = None

    def start(self):
        """A file there is copied in no time, as it is at one moment."""
        image = _image(trees.WORK / "pool.img", "6G", MAKE["xfs"])
        self._pool.mkdir()
        trees.run("mount", "-o", "loop", image, self._pool)
        trees.run("mount", "--bind", "/proc", self._tree / "proc")
        preload = self._tree / "usr/local/lib/without-sync.so"
        subprocess.run(["gcc", "-shared", "-fPIC", "-x", "c", "-o", preload, "-"], input=WITHOUT_SYNC, text=True, check=True)

    def stop(self):
        self._end_writer()

    def prove(self, results):
        for kind in MAKE:
            cuts = self._cut(kind, CUTS)
            results.add(f"{kind}, {CUTS} power cuts, {cuts['sets']} sets: {len(cuts['wrong'])} torn or lost", cuts["wrong"][:10])
            control = self._cut(kind, max(CUTS // 10, 10), "LD_PRELOAD=/usr/local/lib/without-sync.so")
            results.add(f"{kind}, without syncing {len(control['wrong'])} torn or lost",
                        [] if control["wrong"] else ["the test sees nothing"])

    def _cut(self, kind, count, *variables):
        disk = _image(self._pool / f"{kind}.img", "512M", MAKE[kind])
        mounted = trees.WORK / f"{kind}-disk"
        mounted.mkdir(exist_ok=True)
        trees.run("mount", "-o", "loop", disk, mounted)
        for part in KEPT:
            (self._tree / part).mkdir(parents=True, exist_ok=True)
            (mounted / part).parent.mkdir(parents=True, exist_ok=True)
            trees.run("cp", "-a", self._tree / part, mounted / part)
            trees.run("mount", "--bind", mounted / part, self._tree / part)
        trees.run("sync", "-f", mounted)
        answered = trees.WORK / f"{kind}-answered"
        with open(answered, "w") as file:
            self._writer = subprocess.Popen(["unshare", "--uts", "chroot", self._tree, "env", "-i", *variables, "sh", "-c", WRITER],
                                            stdout=file)
        machine.wait_until(lambda: len(_last(answered)) == len(SETTINGS), 30, "the first sets")
        wrong = [problem for number in range(count) for problem in self._wrong_after_cut(disk, answered, number)]
        self._end_writer()
        for part in reversed(KEPT):
            trees.run("umount", self._tree / part)
        trees.run("umount", mounted)
        disk.unlink()
        return {"wrong": wrong, "sets": len(answered.read_text().splitlines())}

    def _wrong_after_cut(self, disk, answered, number):
        time.sleep(random.uniform(0, 0.05))
        copy = disk.with_suffix(".cut")
        before = _last(answered)
        trees.run("cp", "--reflink=always", disk, copy)
        after = _last(answered)
        folder = trees.WORK / "cut"
        folder.mkdir(exist_ok=True)
        # Two file systems with the same identity are one too many for XFS.
        trees.run("mount", "-o", "loop" + (",nouuid" if "xfs" in disk.name else ""), copy, folder)
        wrong = []
        for setting, (_, path, pattern) in SETTINGS.items():
            text = (folder / path).read_text(errors="replace") if (folder / path).exists() else "no file"
            found = re.search(pattern, text, re.MULTILINE)
            if found is None or not before[setting] <= int(found.group(1)) <= after[setting] + 1:
                wrong.append(f"cut {number}: {path}: {text[-100:]!r}, answered {before[setting]} to {after[setting]}")
        trees.run("umount", folder)
        copy.unlink()
        return wrong

    def _end_writer(self):
        if self._writer:
            self._writer.kill()
            self._writer.wait()
            self._writer = None


def _image(path, size, make):
    trees.run("truncate", "-s", size, path)
    trees.run(*make, path)
    return path


def _last(answered):
    """The last number that was answered for, of each setting."""
    return {setting: int(number) for setting, number in re.findall(r"^(\w+) (\d+)$", answered.read_text(), re.MULTILINE)}

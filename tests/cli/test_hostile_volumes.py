# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Volumes made to stop, fill or fool whoever searches them: all at once, and one by one when TAVISK_LONG is set."""

import os
import pathlib
import re
import socket
import stat
import sys
import time
import unittest

from machine import SANITIZER_OPTIONS, ScratchMachine, program_and_arguments

CORE = "System/Library/CoreServices"
VERSION = f"{CORE}/SystemVersion.plist"
GOOD = b"<dict><key>ProductName</key><string>%s</string><key>ProductVersion</key><string>10.4</string></dict>"
OUTSIDE = b"From Outside"
SECONDS, KIB = (2, 64 << 10) if not SANITIZER_OPTIONS else (20, 1 << 30)
# What a search looks at.
PLACES = [VERSION, f"{CORE}/ServerVersion.plist", f"{CORE}/boot.efi", f"{CORE}/mach_kernel", "mach_kernel", CORE, "System",
          "WINDOWS", "WINDOWS/SYSTEM.INI", "software_version"]


def sparse(path):
    with open(path, "wb") as file:
        file.truncate(1 << 40)


def bind(path):
    """Its path is too long for a socket's address."""
    with socket.socket(socket.AF_UNIX) as listener:
        folder = os.open(os.path.dirname(path), os.O_PATH)
        listener.bind(f"/proc/self/fd/{folder}/{os.path.basename(path)}")
        os.close(folder)


def deep(path):
    os.mkdir(path)
    folder = os.open(path, os.O_PATH)
    for _ in range(400):
        os.mkdir("d", dir_fd=folder)
        below = os.open("d", os.O_PATH, dir_fd=folder)
        os.close(folder)
        folder = below
    os.close(folder)


def crowded(path):
    os.mkdir(path)
    for number in range(2000):
        os.mkdir(f"{path}/{number}")


KINDS = {
    "FIFO": os.mkfifo,
    "socket": bind,
    "folder": os.mkdir,
    "loop": lambda path: os.symlink(os.path.basename(path), path),
    "way out": lambda path: os.symlink("../" * 30 + "outside", path),
    "absolute way out": lambda path: os.symlink(os.environ["OUTSIDE"], path),
    "endless device": lambda path: os.symlink("/dev/zero", path),
    "own memory": lambda path: os.symlink("/proc/self/mem", path),
    "1 TiB": sparse,
    **({"device": lambda path: os.mknod(path, stat.S_IFCHR | 0o600, os.makedev(1, 5))} if os.geteuid() == 0 else {}),
}
CONTENTS = {
    "nothing": b"",
    "half of it": GOOD[:40],
    "bomb": b'<!DOCTYPE p [<!ENTITY a "aaaaaaaaaa"><!ENTITY b "&a;&a;&a;&a;&a;&a;&a;&a;">]><string>&b;</string>',
    "depth": b"<array>" * 100_000,
    "width": b"<array>" + b"<true/>" * 140_000 + b"</array>",
    "attributes": b"<dict " + b"".join(b'a%d="" ' % number for number in range(60_000)) + b"/>",
    "no text": bytes(range(256)) * 100,
    "controls": GOOD % b"\xc2\x9b2J&#x1b;[2J\x1b]0;x\x07",
    "bad UTF-8": GOOD % b"\xff\xfe\xc0\x80",
    "bidirectional": GOOD % "\u202etxt.exe".encode(),
    "long name": GOOD % (b"n" * 1_000_000),
    "too many bytes": b" " * (1 << 20) + GOOD % b"Late",
    "binary": b"bplist00" + b"\xff" * 1000,
    "wrong types": b"<dict><key>ProductName</key><array/><key>ProductVersion</key><data>AAAA</data></dict>",
}
NAMES = [b"\x1b[2J", "\u202ename".encode(), b"v" * 250, b"a\nb", b"-f", b"%s%n", b"..%2f.."]


def cases():
    """(name, what makes the volume in its folder) of each."""

    def put(place, make):
        def in_folder(folder):
            os.makedirs(os.path.dirname(f"{folder}/{place}"), exist_ok=True)
            make(f"{folder}/{place}")
        return in_folder

    def write(contents):
        return lambda path: pathlib.Path(path).write_bytes(contents)

    for place in PLACES:
        for kind, make in KINDS.items():
            yield f"{kind} as {place}", put(place, make)
    for kind, contents in CONTENTS.items():
        yield f"{kind} in the version", put(VERSION, write(contents))
    yield "depth of folders", put(CORE, deep)
    yield "crowd of folders", put(CORE, crowded)
    yield "link of a folder's start", put(CORE, lambda path: os.symlink("../../..", path))


class HostileVolumes(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {})
        self.addCleanup(self.machine.__exit__)
        outside = self.machine.directory / "outside"
        (outside / CORE).mkdir(parents=True)
        (outside / VERSION).write_bytes(GOOD % OUTSIDE)
        os.environ["OUTSIDE"] = str(outside)
        for name in ("SystemVersion.plist", "boot.efi", "mach_kernel"):
            self.machine.file(f"/Volumes/Good/{CORE}/{name}", GOOD % b"Lumara X")

    def disks(self, names):
        self.machine.write({"Disks": {f"disk{number}s1": {"Volume Name": name, "Mount Point": f"/Volumes/{name}"}
                                      for number, name in enumerate(names)}, "User Defaults": {"StartupDiskDebug": True}})

    def search(self):
        """What was wrong with a run of both words that search."""
        report = self.machine.directory / "report"
        began = time.monotonic()
        process = self.machine.start(["-liststartupdisks", "-getstartupdisk"], stdout=-1, stderr=-1,
                                     environment={"TAVISK_REPORT": str(report), "TAVISK_LOG": "stderr"})
        output, errors = process.stdout.read(), process.stderr.read()
        _, status, usage = os.wait4(process.pid, 0)
        process.returncode = os.waitstatus_to_exitcode(status)
        process.stdout.close(), process.stderr.close()
        told = errors + report.read_bytes()
        report.unlink()
        wrong = {
            "ended by a signal": process.returncode < 0,
            "the good volume is missing": f"/Volumes/Good/{CORE}".encode() not in output,
            "read outside of the volume": OUTSIDE in output + told,
            "control bytes": re.search(rb"[\x00-\x09\x0b-\x1f\x7f]|\xc2[\x80-\x9f]|\xe2\x80[\xaa-\xae]", told) is not None,
            f"{usage.ru_maxrss} KiB": usage.ru_maxrss > KIB,
            f"{time.monotonic() - began:.1f} s": time.monotonic() - began > SECONDS,
        }
        return [what for what, is_so in wrong.items() if is_so]

    def test_volumes(self):
        made = list(cases())
        self.assertGreater(len(made), 60)
        for number, (_, make) in enumerate(made):
            folder = self.machine.directory / f"root/Volumes/V{number}"
            folder.mkdir(parents=True)
            make(str(folder))
        self.disks(["Good"] + [f"V{number}" for number in range(len(made))])
        self.assertEqual(self.search(), [])
        if "TAVISK_LONG" in os.environ:
            for number, (name, _) in enumerate(made):
                with self.subTest(name):
                    self.disks(["Good", f"V{number}"])
                    self.assertEqual(self.search(), [])
            print(f"{len(made)} volumes, one by one")

    def test_names(self):
        for name in NAMES:
            for file in ("SystemVersion.plist", "boot.efi", "mach_kernel"):
                self.machine.file(f"/Volumes/{name.decode()}/{CORE}/{file}", GOOD % name)
        self.disks(["Good"] + [name.decode() for name in NAMES if b"\x1b" not in name])
        self.assertEqual(self.search(), [])


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What purging the package removes from a tree of files, and what it leaves.

usage: test_purge.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import os
import pathlib
import re
import struct
import subprocess
import sys
import tempfile
import unittest

SCRIPT = pathlib.Path(sys.argv[3], "debian/tavisk.postrm")
STANDARD = "8be4df61-93ca-11d2-aa0d-00e098032b8c"
OWN = "216b9a59-f9b0-4992-b711-0922c3e0edf7"
LEFT = ["/etc/localtime", "/etc/systemd/logind.conf.d/50-other.conf", "/etc/udev/rules.d/60-other.rules",
        "/etc/chrony/sources.d/other.sources", "/etc/systemd/network/99-default.link"]

OTHERS = ["/etc", "/etc/systemd", "/etc/systemd/system.conf.d", "/etc/tmpfiles.d", "/run", "/var", "/var/lib"]


def entry(description):
    return b"\7\0\0\0" + b"\1\0\0\0" + b"\4\0" + (description + "\0").encode("utf-16-le") + b"\x7f\xff\4\0"


def order(*numbers):
    return struct.pack(f"<I{len(numbers)}H", 7, *numbers)


class Purge(unittest.TestCase):
    def setUp(self):
        self._folder = tempfile.TemporaryDirectory()
        self.addCleanup(self._folder.cleanup)
        self.root = pathlib.Path(self._folder.name)
        self.variables = self.root / "sys/firmware/efi/efivars"
        (self.root / "etc").mkdir()
        # What other packages have.
        self.file("/var/lib/dpkg/status", b"Package: other\nStatus: install ok installed\nVersion: 1\nArchitecture: all\n"
                  b"Maintainer: o <o@example>\nDescription: o\n")
        self.file("/var/lib/dpkg/info/other.list", "".join(f"{folder}\n" for folder in OTHERS).encode())

    def file(self, path, contents=b"x"):
        file = self.root / path.lstrip("/")
        file.parent.mkdir(parents=True, exist_ok=True)
        file.write_bytes(contents)

    def variable(self, name, contents, vendor=STANDARD):
        self.file(f"/sys/firmware/efi/efivars/{name}-{vendor}", contents)

    def purge(self):
        """What it complained of."""
        result = subprocess.run(["sh", SCRIPT, "purge"], env={**os.environ, "DPKG_ROOT": str(self.root)},
                                stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=20)
        self.assertEqual((result.returncode, result.stdout), (0, ""), result.stderr)
        return result.stderr

    def files(self):
        return sorted("/" + str(path.relative_to(self.root)) for path in self.root.rglob("*")
                      if path.is_file() and "dpkg" not in path.parts)

    def test_takes_every_file_of_its_own_and_no_other(self):
        for pattern in re.search(r"own_files='\n(.*?)\n'", SCRIPT.read_text(), re.DOTALL)[1].split():
            self.file(pattern.replace("*", "some") + ("" if "." in pattern else "/file"))
        for folder in ("/etc", "/Library/Preferences/SystemConfiguration"):
            self.file(folder + "/.tavisk-1234567")
        for path in LEFT:
            self.file(path)
        self.assertEqual(self.purge(), "")
        self.assertEqual(self.files(), sorted(LEFT))
        folders = {"/" + str(path.relative_to(self.root)) for path in self.root.rglob("*") if path.is_dir()}
        kept = {str(parent) for path in LEFT for parent in pathlib.Path(path).parents}
        self.assertEqual(folders - {"/var/lib/dpkg", "/var/lib/dpkg/info"}, {*kept, *OTHERS} - {"/"})

    def test_takes_its_boot_entries_out_of_the_order_first(self):
        self.variable("Boot0001", entry("debian"))
        self.variable("Boot000A", entry("tavisk Main"))
        self.variable("BootOrder", order(10, 1, 3))
        self.variable("prev-lang:kbd", b"\7\0\0\0en:0", OWN)
        self.assertEqual(self.purge(), "")
        self.assertEqual([path.name[:-len(STANDARD) - 1] for path in sorted(self.variables.iterdir())],
                         ["Boot0001", "BootOrder"])
        self.assertEqual((self.variables / f"BootOrder-{STANDARD}").read_bytes()[:8], order(1, 3))

    def test_leaves_a_machine_that_starts_from_nothing_else(self):
        self.variable("Boot0000", entry("tavisk Main"))
        self.variable("BootOrder", order(0))
        before = self.files()
        self.assertIn("stay", self.purge())
        self.assertEqual(self.files(), before)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])

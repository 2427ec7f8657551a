# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Volumes that are plugged in, changed and pulled while the prompt waits."""

import subprocess
import sys
import unittest

from machine import ScratchMachine, program_and_arguments

FOLDER = "/System/Library/CoreServices"


class AtThePrompt(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {"Disks": {}})
        self.addCleanup(self.machine.__exit__)
        for name in ("Main", "Backup"):
            self.machine.file(f"/Volumes/{name}{FOLDER}/boot.efi")
            self.machine.file(f"/Volumes/{name}/mach_kernel")
        self.machine.change({"Disks": {"disk0s1": self.volume("Main")}})
        self.process = self.machine.start([], stdin=subprocess.PIPE, stdout=subprocess.PIPE)
        self.addCleanup(self.finish)
        self.answer()
        self.assertEqual(self.listed(), ["Main"])

    def finish(self):
        self.process.kill()
        self.process.communicate()

    @staticmethod
    def volume(name, **more):
        return {"Volume Name": name, "Mount Point": f"/Volumes/{name}", **more}

    def answer(self):
        """What was printed up to the next prompt."""
        seen = b""
        while not (seen == b"> " or seen.endswith(b"\n> ")) or seen == b"> tavisk\n> ":
            piece = self.process.stdout.read1(4096)
            self.assertTrue(piece, f"the program ended after {seen!r}")
            seen += piece
        return seen[:-2].decode()

    def type(self, line):
        self.process.stdin.write(line.encode() + b"\n")
        self.process.stdin.flush()
        return self.answer()

    def listed(self):
        folders = self.type("-liststartupdisks").splitlines()
        return [folder.removeprefix("/Volumes/").removesuffix(FOLDER) for folder in folders]

    def test_a_volume_is_listed_two_lines_after_it_was_plugged_in_and_not_earlier(self):
        self.machine.change({"Disks": {"disk1s1": self.volume("Backup")}})
        self.assertEqual(self.listed(), ["Main"])
        self.assertEqual(self.listed(), ["Main"])
        self.assertEqual(self.listed(), ["Main", "Backup"])

    def test_two_empty_lines_show_what_came_changed_and_went(self):
        for changes, left in (({"disk1s1": self.volume("Backup")}, ["Main", "Backup"]),
                              ({"disk0s1": {"Kind": "hfs"}}, ["Main", "Backup"]),
                              ({"disk0s1": {"Size": 5}}, ["Backup"]),
                              ({"disk0s1": {"Mount Point": "/Volumes/Backup"}, "disk1s1": None}, ["Backup"])):
            self.machine.change({"Disks": changes})
            self.type("")
            self.type("")
            self.assertEqual(self.listed(), left)

    def test_a_machine_that_cannot_be_read_changes_nothing_and_is_told(self):
        self.machine.plist.write_bytes(b"<plist><dict><key>Disks</key><dict>")
        self.type("")
        self.assertEqual(self.listed(), ["Main"])
        self.assertEqual(len(self.machine.effects()), 1)


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

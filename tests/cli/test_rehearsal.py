# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A copy that is kept has the machine's disks, and answers and is changed as the machine would be."""

import sys
import unittest

from machine import ScratchMachine, program_and_arguments

CORE = "/System/Library/CoreServices"
VERSIONS = b"<plist><dict><key>ProductName</key><string>Debian</string></dict></plist>"
STARTABLE = {"Scheme": 2, "Protocol": "USB", "Size": 4096, "Internal": False}
MACHINE = {
    "Disks": {
        "disk0s2": {"Volume Name": "Main", "Mount Point": "/"},
        "disk1s3": {"Volume Name": "Backup", "Mount Point": "/Volumes/Backup", "UUID": "1-2", **STARTABLE},
        "disk2s1": {"Volume Name": "Win", "Mount Point": "/Volumes/Win", "Kind": "ntfs"},
        "disk3s1": {"Volume Name": "Away"},
        "disk4": {"Mount Point": "/Volumes/Image", "Protocol": "Disk Image"},
    },
    "Firmware": {"Legacy Boot": True, "Boot Preference": {"Disk": "disk0s2"}},
    "Registry": {"Interfaces": {"en0": {"Path": "/pci/eth"}}, "Device Tree": {"/": {"compatible": b"HalbRISC\0"}}},
}
WORDS = ["-liststartupdisks", "-getstartupdisk"]
CHOOSE = ["-setstartupdisk", "/mnt/backup" + CORE]


class Kept(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, MACHINE)
        self.addCleanup(self.machine.__exit__)
        for volume in ("", "/Volumes/Image", "/mnt/backup"):
            self.machine.file(volume + CORE + "/boot.efi", b"x" * 100)
            self.machine.file(volume + "/mach_kernel")
        self.machine.file("/mnt/backup" + CORE + "/SystemVersion.plist", VERSIONS)
        self.machine.file("/Volumes/Win/WINDOWS/SYSTEM.INI")
        self.machine.place("/Volumes/Backup").symlink_to("/mnt/backup")
        self.copy = ScratchMachine(PROGRAM)
        self.addCleanup(self.copy.__exit__)

    def rehearse(self, *words):
        self.machine.program = PROGRAM + "ctl"
        told = self.machine.run(["rehearse", "--keep", str(self.copy.directory), *words])
        self.machine.program = PROGRAM
        return told

    def test_the_same_is_found_on_the_same_disks(self):
        self.rehearse("-getdate")
        self.assertEqual(self.copy.run(WORDS), self.machine.run(WORDS))
        self.assertIn(b"/mnt/backup" + CORE.encode(), self.copy.run(WORDS)[0])
        copied = self.copy.read()
        self.assertEqual(list(copied["Disks"]), list(MACHINE["Disks"]))
        self.assertEqual(copied["Disks"]["disk1s3"], copied["Disks"]["disk1s3"] | MACHINE["Disks"]["disk1s3"])
        self.assertEqual(copied["Registry"]["Device Tree"], MACHINE["Registry"]["Device Tree"])
        self.assertEqual(copied["Registry"]["Interfaces"]["en0"]["Path"], "/pci/eth")
        self.assertEqual(self.copy.place("/Volumes/Backup").readlink().name, "backup")
        self.assertEqual(self.copy.read("/mnt/backup" + CORE + "/SystemVersion.plist"), {"ProductName": "Debian"})

    def test_links_and_folders_on_the_way_are_as_on_the_machine(self):
        self.machine.change({"Disks": {"disk5": {"Mount Point": "/Volumes/Empty"}, "disk6": {"Mount Point": "/deep/../far"},
                                       "disk7": {"Mount Point": "/Volumes/Folder"}, "disk8": {"Mount Point": "/Volumes/Folder/mach_kernel"}},
                             "Firmware": {"Boot Preference": {"Disk": "disk5"}}})
        self.machine.file("/mnt/empty/x")
        self.machine.place("/Volumes/Empty").symlink_to("/mnt/empty")
        self.machine.file("/deep/x")
        for volume in ("/far", "/Volumes/Folder", "/Volumes/Folder/mach_kernel"):
            self.machine.file(volume + CORE + "/boot.efi")
            self.machine.file(volume + CORE + "/mach_kernel")
        self.assertEqual(self.rehearse("-getdate")[1], b"")
        listed = self.machine.run(WORDS)
        self.assertIn(b"/mnt/empty/WINNT", listed[0])
        self.assertIn(b"\n/far" + CORE.encode(), listed[0])
        self.assertEqual(self.copy.run(WORDS), listed)

    def test_what_is_chosen_is_chosen_there(self):
        before = self.machine.read()
        self.rehearse(*CHOOSE)
        self.assertEqual(self.machine.read()["Firmware"], before["Firmware"])
        self.machine.run(CHOOSE)
        self.assertEqual(self.machine.read()["Firmware"]["Boot Preference"]["Disk"], "disk1s3")
        for key in ("Boot Preference", "Variables"):
            self.assertEqual(self.copy.read()["Firmware"][key], self.machine.read()["Firmware"][key])
        self.assertEqual(self.copy.run(WORDS), self.machine.run(WORDS))

    def test_a_refused_choice_is_refused_there_too(self):
        self.machine.change({"Firmware": {"Set Boot Preference Status": 5}})
        self.assertIn(b"status 5", self.rehearse(*CHOOSE)[0])
        self.assertEqual(self.copy.read()["Firmware"]["Boot Preference"], {"Disk": "disk0s2"})
        self.assertIn("status 5", self.copy.read()["Refusals"]["Startup Disk"])


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""System calls of the real program fail, or end it, on a scratch machine; and what it does with files, call by call."""

import os
import plistlib
import re
import subprocess
import sys
import tempfile
import unittest

import injection

PLIST = "/machine.plist"
COMMANDS = [
    injection.Command("computername", "Old", "New"),
    injection.Command("kernelbootarchitecture", "i386", "x86_64", get="-getkernelbootarchitecturesetting",
                      reset="kernelarchitecture"),
    injection.Command("networktimeserver", "192.0.2.1", "192.0.2.2", reset="networktimeserver"),
]


class Scratch(injection.Place):
    def __init__(self, folder):
        super().__init__(["env", "-i", "PATH=/usr/sbin:/usr/bin:/sbin:/bin", "ASAN_OPTIONS=detect_leaks=0",
                          f"TAVISK_HOST=scratch:{folder}/machine"], PROGRAM, "/", folder, [f"{folder}/machine"])
        os.mkdir(f"{folder}/machine")
        with open(f"{folder}/machine{PLIST}", "wb") as plist:
            plistlib.dump({"Preferences": {"Other": {"Kept": True}}}, plist)

    def plain(self, contents, path):
        """Without what each run counts anew."""
        if path.endswith(("/effects.log", ".lock")):
            return b""
        if not path.endswith(PLIST) or not contents.endswith(b"</plist>\n"):
            return contents
        return plistlib.dumps({key: value for key, value in plistlib.loads(contents).items() if key != "Authorization"})


class Faults(unittest.TestCase):
    def setUp(self):
        folder = tempfile.TemporaryDirectory(prefix="tavisk-faults.")
        self.addCleanup(folder.cleanup)
        self.folder = folder.name
        self.place = Scratch(self.folder)

    def test_what_a_fault_leaves(self):
        for command in COMMANDS:
            with self.subTest(command.setting):
                runs, found = injection.sweep(self.place, command, injection.few_of)
                print(f"{command.setting}: {runs} runs", flush=True)
                self.assertEqual([f"{kind}: {detail}" for kind, details in found.items() for detail in details], [])

    def test_a_reset_that_was_killed_is_ended_by_the_next(self):
        for command in COMMANDS[1:]:
            with self.subTest(command.setting):
                runs, wrong = injection.wrong_resets(self.place, command)
                self.assertGreater(runs, 5)
                self.assertEqual(wrong, [])

    def test_a_new_file_is_on_the_disk_before_it_takes_the_old_one_s_place_and_then_its_name(self):
        self.place.run(COMMANDS[1].set("i386"), "-y", "-e", "trace=openat,write,fsync,renameat")
        made = re.findall(r'openat\(\d+<(.*)>, "(\.tavisk-\d+)", (\S+), 0600\)', self.place.trace())
        self.assertEqual({folder.removeprefix(self.folder) for folder, _, _ in made},
                         {"/machine", "/machine/root/Library/Preferences/SystemConfiguration"})
        for folder, name, flags in made:
            file = re.escape(f"{folder}/{name}")
            self.assertEqual(flags, "O_RDWR|O_CREAT|O_EXCL|O_NOFOLLOW|O_CLOEXEC")
            self.assertRegex(self.place.trace(), rf'(?s)write\(\d+<{file}>.*?fsync\(\d+<{file}>.*?'
                             rf'renameat\(\d+<{folder}>, "{name}",((?!openat).)*fsync\(\d+<{folder}>')

    def test_what_did_not_get_to_the_disk_is_told(self):
        told = []
        for call in range(1, 7):
            self.place.run(COMMANDS[1].set("i386"), "-y", "-e", f"inject=fsync:error=EIO:when={call}")
            if re.search(r"fsync\(\d+<.*/SystemConfiguration.*INJECTED", self.place.trace()):
                (entry,) = self.place.report()
                told += [effect.get("why", effect["outcome"]) for effect in entry["effects"]]
        self.assertEqual(told, ["Input/output error", "Input/output error; the new value may not survive a power cut"])

    def test_a_write_that_is_interrupted_is_made_again(self):
        self.place.run(COMMANDS[1].set("i386"), "-y", "-e", "inject=write:error=EINTR:when=1..3+2")
        self.assertEqual(len(re.findall(r"write\(\d+<.*/\.tavisk-.*INJECTED", self.place.trace())), 2)
        (entry,) = self.place.report()
        self.assertEqual({effect["outcome"] for effect in entry["effects"]}, {"applied"})


PROGRAM = os.path.abspath(sys.argv.pop(1))
if subprocess.run(["strace", "-qq", "-o", "/dev/null", "true"], stderr=subprocess.DEVNULL, check=False).returncode:
    print("skipped: calls cannot be traced here")
    sys.exit(77)
unittest.main()

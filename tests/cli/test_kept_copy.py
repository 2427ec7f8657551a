# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A kept copy refuses, and cannot read, what its machine does, and is not made within that.

usage: test_kept_copy.py PROGRAM
"""

import sys
import unittest

from machine import ScratchMachine, program_and_arguments

REFUSALS = {"Time Zone": "the rules are damaged", "Display Sleep (read)": "the console is gone"}


class KeptCopy(unittest.TestCase):
    def test_fails_for_the_reasons_of_the_machine(self):
        with ScratchMachine(PROGRAM + "ctl", {"Refusals": REFUSALS}) as machine, ScratchMachine(PROGRAM) as copy:
            machine.run(["rehearse", "--keep", str(copy.directory), "-settimezone", "Europe/Paris"])
            self.assertEqual(copy.read()["Refusals"], REFUSALS)
            copy.run(["-settimezone", "Europe/Paris", "-getdisplaysleep"])
            told = {effect["setting"]: effect["why"] for effect in copy.effects() if "why" in effect}
        self.assertEqual(told, {name.removesuffix(" (read)"): reason for name, reason in REFUSALS.items()})

    def test_is_not_made_in_its_machine(self):
        with ScratchMachine(PROGRAM + "ctl") as machine:
            (machine.directory / "link").symlink_to(".")
            before = sorted(machine.directory.iterdir())
            for folder in ("", "copy", "copy/of/it", "link/copy"):
                told = machine.run(["rehearse", "--keep", str(machine.directory / folder), "-getdate"])
                self.assertIn(b"in the folder of the machine itself", told[1])
                self.assertEqual(told[2], 1)
            self.assertEqual(sorted(machine.directory.iterdir()), before)


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

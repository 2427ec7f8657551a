# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The manual's recipe for scripts says "done" of what was done, and of nothing else.

usage: test_recipe.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import concurrent.futures
import copy
import os
import pathlib
import subprocess
import sys
import unittest

sys.path.append(str(pathlib.Path(__file__).parents[1] / "cli"))
import reports  # noqa: E402
from machine import ScratchMachine, merged  # noqa: E402

PROGRAM = pathlib.Path(sys.argv[1])
FOLDER = "/System/Library/CoreServices"
SWITCHES = ["wakeonmodem", "wakeonnetworkaccess", "restartpowerfailure", "allowpowerbuttontosleepcomputer"]

WORKING = {
    "Clock": {"Time": 1173258303},
    "Power Sources": {"AC Power": dict.fromkeys(("Wake On Ring", "Wake On LAN", "Auto Restart", "Power Button Sleep"), False)},
    "Registry": {"Services": {"VelmarSMU": {"ServerID": b"\3"}}},
    "Disks": {"disk0s2": {"Volume Name": "Main", "Mount Point": "/"}},
}
REFUSING = {"Refusals": {"*": "the file system is read-only"}}
RUNS_NETWORK_TIME = {"Network Time": {"Running": True}}

DONE = [
    "-setdate 11:21:26", "-setdate 1/2/2030", "-settime 13:30:00", "-settime 0:0:0", reports.RECIPE_SETS, "-settimezone Etc/UTC",
    "settimezone Asia/Tokyo", "-setusingnetworktime on", "-setusingnetworktime OFF", "-setnetworktimeserver time.example.org",
    "-setsleep 30", "-setsleep never", "-setcomputersleep 0", "-setdisplaysleep Off", "-setharddisksleep 180",
    *(f"-set{switch} on" for switch in SWITCHES), "-setwakeonmodem off", "-setrestartfreeze on", "-setrestartfreeze off",
    "-setwaitforstartupafterpowerfailure 60", "-setwaitforstartupafterpowerfailure ' +00'", "-settime 9:9", "-setremotelogin on", "-setremotelogin off", "-setremotevelmarevents on",
    "-setremotevelmarevents off", "-setcomputername 'File Server, Second Floor'", "-setcomputername ''", "-setlocalsubnetname files",
    "-setkernelbootarchitecture i386", "-setkernelbootarchitecture x86_64", "-setstartupdisk " + FOLDER,
    "-setdisablekeyboardwhenenclosurelockisengaged yes", "-settime 9:9:9 -setdate 1:1:20", "-setremotelogin on -setremotelogin on",
    "-gettimezone", "-getwakeonmodem", "-help", "-printcommands",
]
NOT_TAKEN = [
    "-settimezon Europe/Paris", "'' -settime 9:9:9", "-settime 9:9:9 --bogus", "-setdate 13:45", "-settime 25:00:00", "-settime 99",
    "-settimezone Europe/Pari", "-settimezone", "-setusingnetworktime maybe", "-setnetworktimeserver ''", "-setsleep 181",
    "-setcomputersleep soon", "-setdisplaysleep -1", "-setharddisksleep ''", "-setwakeonmodem yes", "-setrestartfreeze 1",
    "-setwaitforstartupafterpowerfailure 45", "-setremotelogin perhaps", "-setlocalsubnetname db_4",
    "-setkernelbootarchitecture sparc", "-setdisablekeyboardwhenenclosurelockisengaged maybe", "-setstartupdisk Nowhere",
    "-setremotevelmarevents ''", "-setallowpowerbuttontosleepcomputer ''", "-settimezone Mars/Base -settimezone Etc/UTC", "", "-settime abc", "-settime 9:x", "-setdate 1:1:x",
    "-setwaitforstartupafterpowerfailure soon",
]
WHERE_ALL_IS_REFUSED = [
    "-settime 9:9:9", reports.RECIPE_SETS, "-setusingnetworktime on", "-setnetworktimeserver time.example", "-setsleep 30", "-setrestartfreeze on",
    "-setremotelogin on", "-setremotevelmarevents on", "-setcomputername Files", "-setlocalsubnetname files",
    "-setkernelbootarchitecture i386", "-setdisablekeyboardwhenenclosurelockisengaged yes", "-setstartupdisk " + FOLDER,
]
WHERE_NOTHING_IS_SUPPORTED = [f"-set{switch} on" for switch in SWITCHES] + ["-setwaitforstartupafterpowerfailure 60"]

CASES = [
    *((WORKING, words, True) for words in DONE),
    *((WORKING, words, False) for words in NOT_TAKEN),
    *((merged(copy.deepcopy(WORKING), REFUSING), words, False) for words in WHERE_ALL_IS_REFUSED),
    *(({}, words, False) for words in WHERE_NOTHING_IS_SUPPORTED),
    *((RUNS_NETWORK_TIME, words, False) for words in ("-settime 9:9:9", "-setdate 1:1:20")),
    ({"User": {"ID": 1000}}, reports.RECIPE_SETS, False),
]


class Recipe(unittest.TestCase):
    def test_says_done_of_what_was_done_and_of_nothing_else(self):
        with concurrent.futures.ThreadPoolExecutor(os.cpu_count()) as several:
            wrong = [fault for fault in several.map(self.fault_of, CASES) if fault]
        self.assertEqual(wrong, [])
        counts = [sum(case[2] is is_done for case in CASES) for is_done in (True, False)]
        self.assertGreaterEqual(min(counts), 40, counts)

    def fault_of(self, case):
        description, words, is_done = case
        with ScratchMachine(PROGRAM, description) as machine:
            machine.file(FOLDER + "/boot.efi")
            machine.file("/mach_kernel")
            (machine.directory / "sudo").write_text('#!/bin/sh\nexec "$@"\n')  # with the rules of the example
            (machine.directory / "sudo").chmod(0o755)
            path = {"PATH": f"{machine.directory}:{PROGRAM.parent}:{os.environ['PATH']}"}
            said = subprocess.run(["sh", "-c", reports.recipe(words)], env=machine.environment(**path),
                                  stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=20)
            return said.stdout != "done\n" * is_done and f"{words}: {said.stdout!r} {said.stderr!r}"


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])

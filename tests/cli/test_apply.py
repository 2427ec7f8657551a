# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""taviskctl apply while it takes long: what a terminal shows, and what a signal leaves behind."""

import fcntl
import os
import signal
import subprocess
import sys
import time
import unittest

from machine import ScratchMachine, program_and_arguments
from terminal import Terminal, stop_without_terminals

PATIENCE = 10  # seconds
TO_AND_FRO = ["-settimezone", "Europe/Paris", "-settimezone", "Asia/Kolkata"]


class Long(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {})
        self.addCleanup(self.machine.__exit__)

    def wait_until_begun(self):
        deadline = time.monotonic() + PATIENCE
        while "Clock" not in self.machine.read():
            self.assertLess(time.monotonic(), deadline)
            time.sleep(0.001)

    def test_a_terminal_shows_what_takes_long_and_then_nothing_of_it(self):
        terminal = Terminal(self.machine, ["apply", *TO_AND_FRO * 10])
        self.addCleanup(terminal.close)
        self.wait_until_begun()
        with open(self.machine.directory / "machine.lock") as lock:
            fcntl.flock(lock, fcntl.LOCK_EX)
            self.assertTrue(terminal.wait_for("Time Zone ...").endswith("\rTime Zone ..."))
        self.assertRegex(terminal.wait_for("Setting"), r"^\r *\rSetting$")

    def test_a_signal_ends_it_and_gives_the_authorization_up(self):
        with self.machine.start(["apply", *TO_AND_FRO * 40], stdout=subprocess.PIPE) as process:
            self.wait_until_begun()
            process.send_signal(signal.SIGTERM)
            self.assertEqual((process.wait(PATIENCE), process.stdout.read()), (1, b""))
        self.assertEqual(self.machine.read()["Authorization"], {"Authenticated": False, "Deauthentications": 1})


if __name__ == "__main__":
    stop_without_terminals()
    PROGRAM, _ = program_and_arguments(sys.argv)
    PROGRAM = os.path.join(os.path.dirname(PROGRAM), "taviskctl")
    unittest.main(argv=sys.argv[:1])

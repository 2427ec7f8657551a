# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The program at a terminal that knows no line editing: what an administrator sees."""

import sys
import unittest

from machine import ScratchMachine, program_and_arguments
from terminal import Terminal, stop_without_terminals


class AtATerminal(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {"Clock": {"Time": 1173258303}})
        self.addCleanup(self.machine.__exit__)

    def terminal(self, words=()):
        terminal = Terminal(self.machine, words, TERM="dumb")
        self.addCleanup(terminal.close)
        return terminal

    def test_a_session(self):
        terminal = self.terminal()
        self.assertEqual(
            terminal.wait_for("help.\n> ".replace("\n", "\r\n")),
            f"tavisk: rehearsing on {self.machine.directory}\n> tavisk\n> type -help for help.\n> ",
        )
        terminal.type("-getdate\n")
        self.assertEqual(terminal.wait_for("\r\n> "), "-getdate\nDate: 3/7/2007\n> ")
        terminal.type("quit\n")
        self.assertEqual(terminal.status(), 0)

    def test_control_c_ends_the_session(self):
        terminal = self.terminal()
        terminal.wait_for("help.\r\n> ")
        terminal.type("\x03")
        self.assertEqual(terminal.status(), 0)
        self.assertEqual(self.machine.read()["Authorization"]["Deauthentications"], 1)

    def test_a_failure_is_told_in_one_line(self):
        self.machine.change({"Refusals": {"Time": "sealed\x85 off"}})
        terminal = self.terminal(["-settime", "1:2:3"])
        shown = terminal.wait_for("Set Time: 01:02:03\r\n")
        self.assertIn("sealed\\u{0085} off\n", shown)
        self.assertEqual(terminal.status(), 0)


if __name__ == "__main__":
    stop_without_terminals()
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

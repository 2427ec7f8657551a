# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The prompt at a terminal (a pseudo-terminal): what an administrator sees."""

import os
import pty
import select
import sys
import time
import unittest

from machine import ScratchMachine, program_and_arguments

PATIENCE = 10


class Terminal:
    """The program as the only process of a pseudo-terminal."""

    def __init__(self, machine, words=()):
        self.process, self.end = pty.fork()
        if self.process == 0:
            os.execve(machine.program, [machine.program, *words], machine.environment(TERM="dumb"))
        self.seen = ""

    def type(self, text):
        os.write(self.end, text.encode())

    def wait_for(self, text):
        """Everything shown since the last wait, up to the text."""
        deadline = time.monotonic() + PATIENCE
        while text not in self.seen:
            if not select.select([self.end], [], [], max(0, deadline - time.monotonic()))[0]:
                raise AssertionError(f"{text!r} did not come, only {self.seen!r}")
            self.seen += self.read()
        shown, _, self.seen = self.seen.partition(text)
        return (shown + text).replace("\r\n", "\n")

    def read(self):
        piece = os.read(self.end, 4096)
        return piece.decode()

    def status(self):
        return os.waitstatus_to_exitcode(os.waitpid(self.process, 0)[1])

    def close(self):
        os.close(self.end)


class AtATerminal(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {"Clock": {"Time": 1173258303}})
        self.addCleanup(self.machine.__exit__)

    def terminal(self, words=()):
        terminal = Terminal(self.machine, words)
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


def stop_without_terminals():
    try:
        for end in pty.openpty():
            os.close(end)
    except OSError as error:
        print(f"skipped: no pseudo-terminals on this machine: {error}")
        sys.exit(77)


if __name__ == "__main__":
    stop_without_terminals()
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The program at a terminal of its own (a pseudo-terminal)."""

import fcntl
import os
import pty
import re
import select
import struct
import sys
import termios
import time

PATIENCE = 10  # seconds


class Terminal:
    """The program as the only process of a pseudo-terminal."""

    def __init__(self, machine, words=(), **environment):
        self.end, other_end = pty.openpty()
        self.resize(24, 80)
        self.modes = termios.tcgetattr(other_end)
        how = {"stdin": other_end, "stdout": other_end, "stderr": other_end, "start_new_session": True}
        take = lambda: fcntl.ioctl(0, termios.TIOCSCTTY, 0)
        self.process = machine.start(words, environment, preexec_fn=take, **how)
        self.other_end = other_end
        self.seen = ""

    def resize(self, rows, columns):
        fcntl.ioctl(self.end, termios.TIOCSWINSZ, struct.pack("HHHH", rows, columns, 0, 0))

    def type(self, text):
        os.write(self.end, text.encode(errors="surrogateescape"))

    def type_by_hand(self, text):
        """A tab is followed by nothing until the program has had it."""
        for piece in re.findall("[^\t]*\t|[^\t]+", text):
            self.type(piece)
            while piece.endswith("\t") and fcntl.ioctl(self.other_end, termios.FIONREAD, b"\0" * 4) != b"\0" * 4:
                time.sleep(0.001)
            time.sleep(0.05 if piece.endswith("\t") else 0)

    def wait_for(self, text):
        """Everything shown since the last wait, up to the text."""
        deadline = time.monotonic() + PATIENCE
        while text not in self.seen:
            if not select.select([self.end], [], [], max(0, deadline - time.monotonic()))[0]:
                raise AssertionError(f"{text!r} did not come, only {self.seen!r}")
            self.seen += os.read(self.end, 4096).decode(errors="surrogateescape")
        shown, _, self.seen = self.seen.partition(text)
        return (shown + text).replace("\r\n", "\n")

    def status(self):
        return self.process.wait(PATIENCE)

    def close(self):
        self.process.kill()
        self.process.wait()
        os.close(self.end)
        os.close(self.other_end)


def stop_without_terminals():
    try:
        for end in pty.openpty():
            os.close(end)
    except OSError as error:
        print(f"skipped: no pseudo-terminals on this machine: {error}")
        sys.exit(77)

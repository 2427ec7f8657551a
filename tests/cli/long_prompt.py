# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A million lines at the prompt: what the program has grown by since the first ten thousand. Not a part of the suite."""

import os
import pathlib
import re
import sys

from machine import ScratchMachine, program_and_arguments

LINES, FIRST, GROWS = 1_000_000, 10_000, 1024  # KiB
WORDS = b"-getcomputersleep\n"


def state(process):
    resident = re.search(r"VmRSS:\s+(\d+)", pathlib.Path(f"/proc/{process.pid}/status").read_text())
    return int(resident.group(1)), len(os.listdir(f"/proc/{process.pid}/fd"))


def feed(process, count):
    """Each batch is answered before the next."""
    for _ in range(count // 100):
        process.stdin.write(WORDS * 100)
        process.stdin.flush()
        for _ in range(100):
            process.stdout.readline()


def main(program):
    with ScratchMachine(program, {"Power Sources": {"AC Power": {"System Sleep": 5}}}) as machine:
        process = machine.start([], stdin=-1, stdout=-1)
        feed(process, FIRST)
        resident, open_files = state(process)
        feed(process, LINES - FIRST)
        grown, more = (now - before for now, before in zip(state(process), (resident, open_files)))
        process.communicate(b"quit\n")
    print(f"{LINES} lines: {grown} KiB and {more} descriptors more than after {FIRST}")
    return 1 if grown > GROWS or more or process.returncode else 0


if __name__ == "__main__":
    sys.exit(main(program_and_arguments(sys.argv)[0]))

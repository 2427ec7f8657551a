# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What the machines have in common."""

import time

import check


class Trouble(Exception):
    """The machine itself, not a setting, went wrong."""


class Machine:
    """Each one has start, restart, stop (also when it did not start), and run: the Answer of a shell command, run as root;
    Trouble when there is none."""
    name = ""
    has = frozenset()  # what checks may need
    own = frozenset()  # the words of which a check has to need all
    cannot = ""        # what cannot be proven on it, for people

    def prove(self, results):
        """Everything that is to hold on it."""
        check.prove(self, results)

    def prove_more(self, results):
        """What no Check can say."""


def wait_until(condition, seconds, what):
    """The first true value of the condition; Trouble when there is none in time."""
    end = time.monotonic() + seconds
    while not (value := condition()):
        if time.monotonic() > end:
            raise Trouble(f"{what}: not within {seconds} seconds")
        time.sleep(0.1)
    return value

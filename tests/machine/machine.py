# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What the machines have in common."""

import abc
import time


class Trouble(Exception):
    """The machine itself, not a setting, went wrong."""


class Machine(abc.ABC):
    name = ""
    has = frozenset()  # what checks may need
    own = frozenset()  # the words of which a check has to need all
    cannot = ""        # what cannot be proven on it, for people

    @abc.abstractmethod
    def start(self):
        pass

    @abc.abstractmethod
    def run(self, command):
        """The Answer of a shell command, run as root; Trouble when there is none."""

    @abc.abstractmethod
    def restart(self):
        pass

    @abc.abstractmethod
    def stop(self):
        """Also of a machine that did not start."""

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

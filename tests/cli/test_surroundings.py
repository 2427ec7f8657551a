# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Processes that are started oddly: each run says what it did, and does it or leaves the machine as it was."""

import functools
import os
import resource
import stat
import sys
import unittest

from machine import SANITIZER_OPTIONS, ScratchMachine, program_and_arguments

WORDS = ["-setcomputersleep", "20", "-getcomputersleep"]
LAST = b"Computer Sleep: after 20 minutes"


def limit(which, value):
    return functools.partial(resource.setrlimit, which, (value, value))


def closing(*descriptors):
    return lambda: [os.close(number) for number in descriptors]


class Surroundings(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {"Power Sources": {"AC Power": {"System Sleep": 5}}})
        self.addCleanup(self.machine.__exit__)

    def minutes(self):
        return self.machine.read()["Power Sources"]["AC Power"]["System Sleep"]

    def test_what_changes_nothing(self):
        cases = {
            "no standard input": {"preexec_fn": closing(0)},
            "no standard error": {"preexec_fn": closing(2)},
            "umask of everything": {"preexec_fn": lambda: os.umask(0o777) and None},
            "umask of nothing": {"preexec_fn": lambda: os.umask(0) and None},
            "a large variable": {"environment": {"LARGE": "x" * 100_000}},
            "a Turkish locale": {"environment": {"LANG": "tr_TR.UTF-8", "LC_ALL": "tr_TR.UTF-8"}},
            "a German locale": {"environment": {"LC_NUMERIC": "de_DE.UTF-8", "LC_ALL": "de_DE.UTF-8"}},
            "no such zone": {"environment": {"TZ": ":/no/such/zone"}},
            "an endless zone": {"environment": {"TZ": ":/dev/zero"}},
            "preloaded nothing": {"environment": {"LD_PRELOAD": "", "IFS": "x", "PATH": "/no/such"}},
            "few descriptors": {"preexec_fn": limit(resource.RLIMIT_NOFILE, 16)},
            **({} if SANITIZER_OPTIONS else {"no threads": {"preexec_fn": limit(resource.RLIMIT_AS, 14 << 20)}}),
            "no memory to lock": {"preexec_fn": limit(resource.RLIMIT_MEMLOCK, 0)},
        }
        for name, how in cases.items():
            with self.subTest(name):
                self.machine.change({"Power Sources": {"AC Power": {"System Sleep": 5}}})
                output, _, status = self.machine.run(WORDS, **how)
                self.assertEqual((output.splitlines()[-1:], status, self.minutes()), ([LAST], 0, 20))
                self.assertEqual(stat.S_IMODE(self.machine.plist.stat().st_mode) & 0o022, 0)

    def test_what_cannot_be_done(self):
        """Status 1 or a reason, and the old value or the new one."""
        cases = {
            "no standard output": {"preexec_fn": closing(1)},
            "a full device": {"stdout": open("/dev/full", "wb")},  # pylint: disable=consider-using-with
            "a small file": {"preexec_fn": limit(resource.RLIMIT_FSIZE, 100)},
        }
        if not SANITIZER_OPTIONS:  # whose own start ends there
            cases["no file of any size"] = {"preexec_fn": limit(resource.RLIMIT_FSIZE, 0)}
            cases["no descriptors"] = {"preexec_fn": limit(resource.RLIMIT_NOFILE, 4)}
        for name, how in cases.items():
            with self.subTest(name):
                self.machine.change({"Power Sources": {"AC Power": {"System Sleep": 5}}})
                output, errors, status = self.machine.run(WORDS, environment={"TAVISK_LOG": "stderr"}, **how)
                self.assertIn(self.minutes(), (5, 20))
                self.assertTrue(status == 1 or errors, (output, errors, status))
                self.assertGreaterEqual(status, 0)
                self.assertFalse([left for left in os.listdir(self.machine.directory) if left.startswith(".tavisk-")])
        cases["a full device"]["stdout"].close()


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

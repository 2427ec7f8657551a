# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""INT, TERM and HUP end the run at once, wherever it waits; what was printed is out, the authorization given up once."""

import json
import os
import signal
import subprocess
import sys
import time
import unittest

from machine import ScratchMachine, program_and_arguments

ENDING_SIGNALS = (signal.SIGINT, signal.SIGTERM, signal.SIGHUP)
AT_ONCE = 0.1  # seconds
PATIENCE = 10


def read_until(stream, text):
    """What the program has written up to and including the text."""
    seen = b""
    while text not in seen:
        piece = os.read(stream.fileno(), 4096)
        if not piece:
            raise AssertionError(f"{text!r} did not come, only {seen!r}")
        seen += piece
    return seen


class Ending(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {})
        self.addCleanup(self.machine.__exit__)

    def start(self, words, **how):
        how = {"stdin": subprocess.PIPE, "stdout": subprocess.PIPE, "stderr": subprocess.PIPE, **how}
        process = self.machine.start(words, **how)
        self.addCleanup(self.finish, process)
        return process

    @staticmethod
    def finish(process):
        process.kill()
        process.wait()
        for stream in (process.stdin, process.stdout, process.stderr):
            if stream:
                stream.close()

    def end(self, process, number):
        """The status, after a check of the time that the end took."""
        begin = time.monotonic()
        process.send_signal(number)
        status = process.wait(PATIENCE)
        self.assertLess(time.monotonic() - begin, AT_ONCE + 0.05)
        return status

    def assert_given_up_once(self):
        self.assertEqual(self.machine.read()["Authorization"], {"Authenticated": False, "Deauthentications": 1})

    def test_at_the_prompt(self):
        for number in ENDING_SIGNALS:
            with self.subTest(number):
                self.machine.write({})
                process = self.start([])
                read_until(process.stdout, b"help.\n> ")
                self.assertEqual(self.end(process, number), 0)
                self.assert_given_up_once()

    def test_a_second_signal_cuts_nothing_short(self):
        for attempt in range(30):
            with self.subTest(attempt):
                self.machine.write({})
                process = self.start([])
                read_until(process.stdout, b"help.\n> ")
                process.send_signal(signal.SIGINT)
                self.end(process, signal.SIGTERM)
                self.assert_given_up_once()

    def test_while_the_output_is_stuck_in_a_full_pipe(self):
        process = self.start(["-listtimezones"] * 40)
        time.sleep(0.3)  # until the pipe is full: there is no event for it
        self.assertEqual(self.end(process, signal.SIGTERM), 0)
        self.assert_given_up_once()

    def test_the_report_has_the_interrupted_run(self):
        report = self.machine.directory / "report"
        process = self.start([], environment={"TAVISK_REPORT": str(report)})
        read_until(process.stdout, b"help.\n> ")
        self.end(process, signal.SIGHUP)
        last = json.loads(report.read_text().splitlines()[-1])
        self.assertEqual((last["report"], last["signal"]), (1, "SIGHUP"))


class DeadOutput(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {})
        self.addCleanup(self.machine.__exit__)

    def test_a_reader_that_left_ends_the_run_quietly(self):
        reading, writing = os.pipe()
        os.close(reading)
        _, errors, status = self.machine.run(["-listtimezones"] * 50, stdout=writing)
        os.close(writing)
        self.assertEqual((errors, status), (b"", 0))

    def test_a_full_device_and_no_output_at_all_are_said_with_status_1(self):
        for output, why in ((">/dev/full", b"No space left on device"), (">&-", b"Bad file descriptor")):
            ended = subprocess.run(["/bin/sh", "-c", f'exec "$0" -getusingnetworktime {output}', PROGRAM],
                                   env=self.machine.environment(), stderr=subprocess.PIPE, timeout=PATIENCE)
            self.assertEqual((ended.stderr, ended.returncode), (b"tavisk: standard output: " + why + b"\n", 1))


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

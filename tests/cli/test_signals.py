# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""INT, TERM and HUP end the run at once, wherever it waits; what was printed is out, the authorization given up once."""

import contextlib
import json
import os
import signal
import subprocess
import sys
import time
import unittest

import reports
from machine import ScratchMachine, program_and_arguments

AT_ONCE = 2  # seconds, also of a busy machine; without a limit it never ends
PATIENCE = 10
BANNER = b"> tavisk\n> type -help for help.\n> "


def signal_mask(pid):
    with open(f"/proc/{pid}/status", encoding="ascii") as status:
        return next(int(line.split()[1], 16) for line in status if line.startswith("SigBlk:"))


class Run(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {})
        self.addCleanup(self.machine.__exit__)
        self.report = self.machine.directory / "report"


class Ending(Run):
    def end(self, words, *signals):
        """Ends a run that waits, at the prompt when there are no words."""
        self.machine.write({})
        how = {"stdin": subprocess.PIPE, "stdout": subprocess.PIPE, "environment": {"TAVISK_REPORT": str(self.report)}}
        with self.machine.start(words, **how) as process:
            if words:
                self.wait_until_it_may_change(process)
                time.sleep(0.3)  # until the pipe is full: there is no event for it
            else:
                self.assertEqual(process.stdout.read(len(BANNER)), BANNER)
            begin = time.monotonic()
            for number in signals:
                process.send_signal(number)
            try:
                status = process.wait(PATIENCE)
            finally:
                process.kill()
            self.assertLess(time.monotonic() - begin, AT_ONCE)
        self.assertEqual(self.machine.read()["Authorization"], {"Authenticated": False, "Deauthentications": 1})
        return status

    def wait_until_it_may_change(self, process):
        deadline = time.monotonic() + PATIENCE
        while "Authorization" not in self.machine.read() and process.poll() is None:
            self.assertLess(time.monotonic(), deadline)
            time.sleep(0.001)

    def test_at_the_prompt_and_in_the_report(self):
        for number in (signal.SIGINT, signal.SIGTERM, signal.SIGHUP):
            with self.subTest(number):
                self.assertEqual(self.end([], number), 0)
                self.assertEqual(reports.faults(self.report.read_text()), [])
                last = json.loads(self.report.read_text().splitlines()[-1])
                self.assertEqual((last["report"], last["signal"]), (1, number.name))

    def test_a_second_signal_cuts_nothing_short(self):
        for attempt in range(30):
            with self.subTest(attempt):
                self.end([], signal.SIGINT, signal.SIGTERM)

    def test_while_the_output_is_stuck_in_a_full_pipe(self):
        self.assertEqual(self.end(["-listtimezones"] * 40, signal.SIGTERM), 0)


class StuckControl(Run):
    """taviskctl, whose reader has stopped reading before it begins."""

    def full_pipe(self):
        """Where to write."""
        reading, writing = os.pipe()
        self.addCleanup(os.close, reading)
        self.addCleanup(os.close, writing)
        os.set_blocking(writing, False)
        with contextlib.suppress(BlockingIOError):
            while True:
                os.write(writing, b".")
        os.set_blocking(writing, True)
        return writing

    def wait_until_it_prints(self, process):
        """An emulator has a mask of its own."""
        deadline = time.monotonic() + PATIENCE
        while "TAVISK_ARCHITECTURE" not in os.environ and not signal_mask(process.pid) & 1 << signal.SIGTERM - 1:
            self.assertLess(time.monotonic(), deadline)
            time.sleep(0.001)
        time.sleep(2 if "TAVISK_ARCHITECTURE" in os.environ else 0.3)  # until it is stuck: there is no event for it

    @unittest.skipIf("TSAN_OPTIONS" in os.environ, "at its end the thread sanitizer flushes the stream that is stuck")
    def test_a_signal_ends_each_command(self):
        self.machine.program = os.path.join(os.path.dirname(PROGRAM), "taviskctl")
        to_ten = ["-setdisplaysleep", "10"]
        for words in (["apply", *to_ten], ["rehearse", *to_ten], ["undo", "--run"], ["undo", "--since", "@0", "--run"],
                      ["reset", "Display Sleep"]):
            with self.subTest(words), self.machine.start(words, stdout=self.full_pipe()) as process:
                self.wait_until_it_prints(process)
                begin = time.monotonic()
                process.send_signal(signal.SIGTERM)
                try:
                    self.assertEqual(process.wait(PATIENCE), 1)
                finally:
                    process.kill()
                self.assertLess(time.monotonic() - begin, AT_ONCE)
                self.assertFalse(self.machine.read()["Authorization"]["Authenticated"])


class DeadOutput(Run):
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

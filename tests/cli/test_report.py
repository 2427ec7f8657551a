# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A report that cannot be kept, and the descriptors that the run was started with."""

import os
import resource
import sys
import unittest

from machine import ScratchMachine, program_and_arguments

CLOSED_IN_PROGRAMS = 0o2000000  # as /proc/PID/fdinfo tells O_CLOEXEC


class Report(unittest.TestCase):
    def setUp(self):
        self.machine = ScratchMachine(PROGRAM, {})
        self.addCleanup(self.machine.__exit__)
        self.file = self.machine.directory / "report"

    def test_one_that_cannot_be_kept_is_told_once_with_status_1_and_leaves_no_half_line(self):
        earlier = '{"report":1}\n' * 70  # 910 of 1024 bytes
        limit = lambda: resource.setrlimit(resource.RLIMIT_FSIZE, (1024, 1024))
        for opened, why in (("path", "File too large"), ("a", "File too large"), ("r+", "File too large"),
                            ("full", "No space left on device")):
            with self.subTest(opened):
                self.file.write_text(earlier)
                name = "/dev/full" if opened == "full" else self.file
                with open(name, "a" if opened in ("path", "full") else opened, encoding="utf-8") as descriptor:
                    descriptor.seek(0, os.SEEK_END) if opened == "r+" else None
                    number = descriptor.fileno()
                    report = str(self.file) if opened == "path" else f"fd:{number}"
                    output, errors, status = self.machine.run(["-getusingnetworktime"] * 2, pass_fds=[number],
                                                              environment={"TAVISK_REPORT": report}, preexec_fn=limit)
                    self.assertEqual((output.count(b"\n"), errors.decode(), status), (2, f"tavisk: report: {why}\n", 1))
                    self.assertEqual(self.file.read_text(), earlier)
                    if opened == "r+":
                        self.assertEqual(os.lseek(number, 0, os.SEEK_CUR), len(earlier))

    def test_programs_that_are_started_get_none_of_the_descriptors(self):
        with open(self.file, "wb") as other, self.file.open("wb") as named:
            numbers = [other.fileno(), named.fileno()]
            report = {"TAVISK_REPORT": f"fd:{numbers[1]}"}
            with self.machine.start([], report, stdin=-1, stdout=-1, pass_fds=numbers) as process:
                self.assertTrue(process.stdout.read(1))
                for number in numbers:
                    with open(f"/proc/{process.pid}/fdinfo/{number}", encoding="ascii") as info:
                        flags = int(info.read().split()[3], 8)
                    self.assertTrue(flags & CLOSED_IN_PROGRAMS, number)
                process.communicate(b"quit\n", timeout=10)


if __name__ == "__main__":
    PROGRAM, _ = program_and_arguments(sys.argv)
    unittest.main(argv=sys.argv[:1])

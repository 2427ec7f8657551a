# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Whether each defect of script/plant can still be planted, and whether there is one in every room.

usage: test_planted.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import pathlib
import re
import subprocess
import sys
import unittest

SOURCES = pathlib.Path(sys.argv[3])
PATCHES = sorted((SOURCES / "tests/planted").glob("*.patch"))


class Planted(unittest.TestCase):
    def test_says_what_goes_wrong_and_applies(self):
        for patch in PATCHES:
            with self.subTest(patch.name):
                self.assertRegex(patch.read_text(), r"\A[A-Z\d].*\. \[(dev|asan|tsan)( \S+)+\]\n---")
                tried = subprocess.run(["patch", "--dry-run", "--force", "--fuzz=0", "-p1", "-d", SOURCES, "-i", patch],
                                       stdin=subprocess.DEVNULL, capture_output=True, text=True, timeout=20)
                self.assertEqual(tried.returncode, 0, tried.stdout)

    def test_is_in_every_room(self):
        rooms = re.findall(r"^  \w+\[([\w/]+)\]$", (SOURCES / "CONTRIBUTING.md").read_text(), re.MULTILINE)
        planted = {str(pathlib.PurePath(path).parent) for patch in PATCHES
                   for path in re.findall(r"^--- a/src/(\S+)", patch.read_text(), re.MULTILINE)}
        self.assertTrue(rooms)
        self.assertEqual([room for room in rooms if not any(f"{folder}/".startswith(f"{room}/") for folder in planted)], [])


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])

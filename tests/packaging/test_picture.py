# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Whether the picture of the README shows what taviskctl prints now.

usage: test_picture.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import os
import pathlib
import subprocess
import sys
import tempfile

sys.path.append(str(pathlib.Path(__file__).parents[1] / "cli"))
from terminal import stop_without_terminals  # noqa: E402


def main(program, _documents, sources):
    stop_without_terminals()
    with tempfile.NamedTemporaryFile() as now:
        draw = [f"{sources}/script/picture", pathlib.Path(program).with_name("taviskctl"), now.name]
        subprocess.run(draw, check=True, env={**os.environ, "TERM": "dumb"})
        is_current = now.read() == pathlib.Path(sources, "doc/taviskctl.svg").read_bytes()
    print("the picture is current" if is_current else "the picture is old: script/picture draws it anew")
    return 0 if is_current else 1


sys.exit(main(*sys.argv[1:]))

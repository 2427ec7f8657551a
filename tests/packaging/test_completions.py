# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What the shells offer after the words of a command line.

usage: test_completions.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import os
import pathlib
import shutil
import subprocess
import sys
import tempfile

import shells

sys.path.append(str(pathlib.Path(__file__).parents[1] / "cli"))
from terminal import stop_without_terminals  # noqa: E402

NOT_IN_HELP = ["-getkernelbootarchitecturesetting", "-setkernelbootarchitecture"]
SYSTEM_OF_EXAMPLE = "/Volumes/Spare System/System/Library/CoreServices"

# What is typed, and all that is offered.
CASES = [
    ("-gett", ["-gettime", "-gettimezone"]),
    ("GETT", ["gettime", "gettimezone"]),
    ("-Print", ["-printcommands"]),
    ("-f setUsing", ["setusingnetworktime"]),
    ("-setusingnetworktime ", ["Off", "On"]),
    ("SETUSINGNETWORKTIME of", ["Off"]),
    ("-setcomputersleep N", ["Never"]),
    ("-setdisablekeyboardwhenenclosurelockisengaged ", ["No", "Yes"]),
    ("-setkernelbootarchitecture ", ["default", "i386", "x86_64"]),
    ("-settimezone europe/par", ["Europe/Paris"]),
    ("-settimezone Asia/Calc", ["Asia/Calcutta"]),
    ("-setdate ", []),
    ("-setdate 11:21:26 -settime 10:00:00 -getd", ["-getdate", "-getdisablekeyboardwhenenclosurelockisengaged",
                                                 "-getdisplaysleep"]),
    ("-setcomputername -getdate -gettimez", ["-gettimezone"]),
    ("-setstartupdisk /Volumes/S", [SYSTEM_OF_EXAMPLE] if os.geteuid() == 0 else []),
]
# The same of taviskctl.
CONTROL_CASES = [
    ("s", ["status"]),
    ("--v", ["--version"]),
    ("status --", ["--all", "--help", "--json", "--version"]),
    ("status --all tim", ["time", "time-zone"]),
    ("apply --", ["--allow-lockout", "--from", "--help", "--json", "--skip-unsupported", "--version"]),
    ("apply --json -gett", ["-gettime", "-gettimezone"]),
    ("apply SETT", ["settime", "settimezone"]),
    ("apply -settimezone europe/par", ["Europe/Paris"]),
    ("apply -f -setcomputersleep 5 -setusingnetworktime ", ["Off", "On"]),
    ("apply --from want", ["wanted.json"]),
    ("apply --from wanted.json --j", ["--json"]),
    ("undo --", ["--allow-lockout", "--force", "--help", "--json", "--last", "--run", "--since", "--version"]),
    ("undo --since ", ["now", "today", "yesterday"]),
    ("undo --since today --r", ["--run"]),
    ("undo t", []),
    ("reset --", ["--help", "--json", "--version"]),
    ("reset displaysleep tim", ["time", "time-zone"]),
]


def command_words(environment):
    printed = subprocess.run(["tavisk", "-printcommands"], env=environment, capture_output=True, text=True, check=True)
    return [line.split()[1].lower() for line in printed.stdout.splitlines()]


def wrong_offers(name, cases, documents, environment):
    lines = [f"{name} {typed}" for typed, _ in cases]
    for shell, complete in shells.SHELLS.items():
        offered = complete(pathlib.Path(documents, "share"), name, lines, environment)
        for (typed, expected), offers in zip(cases, offered, strict=True):
            if sorted(offers) != sorted(expected):
                yield f"{shell}: {name} {typed}: expected {expected}, offered {offers}"


def main(program, documents, sources):
    if missing := [shell for shell in shells.SHELLS if not shutil.which(shell)]:
        print("skipped: there is no", *missing)
        return 77
    stop_without_terminals()
    with tempfile.TemporaryDirectory() as folder:
        machine = shutil.copytree(pathlib.Path(sources, "packaging/machines/two-systems"), pathlib.Path(folder, "m"))
        pathlib.Path(folder, "wanted.json").touch()
        os.chdir(folder)
        environment = {**os.environ, "PATH": f"{pathlib.Path(program).parent}:{os.environ['PATH']}", "TERM": "dumb",
                       "TAVISK_HOST": f"scratch:{machine}"}
        wrong = [*wrong_offers("tavisk", [*CASES, ("-", command_words(environment) + NOT_IN_HELP)], documents, environment),
                 *wrong_offers("taviskctl", CONTROL_CASES, documents, environment)]
    print("\n".join(wrong) or "every offer is as expected")
    return 1 if wrong else 0


sys.exit(main(*sys.argv[1:]))

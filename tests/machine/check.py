# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What is checked on a machine. Each module of checks/ has a list CHECKS."""

import dataclasses
import importlib
import pathlib
import re
import sys

sys.path.append(str(pathlib.Path(__file__).parents[1] / "cli"))
import reports  # noqa: E402

LONGEST_SHOWN = 500
REPORTS = "/run/tavisk-reports"
# Before each check's command; users who are not root are handed the descriptor.
REPORTING = f"exec 9>>{REPORTS}; export TAVISK_REPORT=fd:9; "
STOP_BUS = "systemctl stop dbus.socket dbus"
# These daemons do not find back by themselves to a bus that was started anew.
WITHOUT_BUS = (STOP_BUS + " systemd-hostnamed systemd-timedated; {}; "
               "systemctl start dbus.socket; systemctl restart systemd-logind; ")
ANYTHING = re.compile(".*", re.DOTALL)


@dataclasses.dataclass(frozen=True)
class Answer:
    """What a command on a machine left."""
    status: int
    output: str
    errors: str


@dataclasses.dataclass(frozen=True)
class Check:
    """A command that changes or reads a setting, and how the machine's own tools see it afterwards.

    Texts are compared as they are, patterns with the whole output. `needs` are words of the machine's `has`.
    With `kept`, `then` holds after a restart too; no later check of the same machine may undo it.
    """
    name: str
    do: str
    prints: str | re.Pattern = ""
    status: int = 0
    errors: str | re.Pattern = ANYTHING
    then: dict = dataclasses.field(default_factory=dict)
    kept: bool = False
    needs: frozenset = frozenset()


def every():
    modules = sorted(path.stem for path in pathlib.Path(__file__).with_name("checks").glob("*.py"))
    return [check for name in modules for check in importlib.import_module("checks." + name).CHECKS]


def _matches(expected, text):
    return expected.fullmatch(text) is not None if isinstance(expected, re.Pattern) else text == expected


def _difference(what, expected, got):
    if _matches(expected, got):
        return []
    return [f"{what}: expected {getattr(expected, 'pattern', expected)!r}", f"{what}: got {got[-LONGEST_SHOWN:]!r}"]


def _do(machine, check):
    answer = machine.run(REPORTING + check.do)
    problems = (_difference("output", check.prints, answer.output) + _difference("errors", check.errors, answer.errors) +
                _difference("status", str(check.status), str(answer.status)))
    if problems and check.errors is ANYTHING:
        problems.append(f"errors: {answer.errors[-LONGEST_SHOWN:]!r}")
    return problems and [f"after {check.do}", *problems]


def _see(machine, check):
    return [problem for command, expected in check.then.items()
            for problem in _difference(command, expected, machine.run(command).output)]


def do_all(machine, checks, results, when=""):
    checks = list(checks)
    for check in checks:
        problems = _do(machine, check) + _see(machine, check)
        if problems:
            told = machine.run(f"grep -ho '\"effects\":.*\"failed\".*' {REPORTS} | tail -n 3").output
            problems += [line[:LONGEST_SHOWN] for line in told.splitlines()]
        results.add(f"{machine.name}{when}: {check.name}", problems)
    if not checks:
        return
    kept = machine.run(f"cat {REPORTS}; rm -f {REPORTS}").output
    results.add(f"{machine.name}{when}: every report is as its schema says", reports.faults(kept) if kept else ["there is none"])


class Results:
    def __init__(self):
        self.passed = self.failed = 0

    def add(self, title, problems):
        self.failed += bool(problems)
        self.passed += not problems
        print("FAILED" if problems else "ok    ", title, flush=True)
        for problem in problems:
            print("        " + problem, flush=True)


def prove(machine, results):
    """All checks of this machine, what is kept over a restart, and all checks again."""
    checks = [check for check in every() if machine.own <= check.needs <= machine.has]
    do_all(machine, checks, results)
    machine.restart()
    for check in checks:
        if check.kept:
            results.add(f"{machine.name}, restarted: {check.name}", _see(machine, check))
    do_all(machine, checks, results, ", again")
    machine.prove_more(results)

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Runs transcripts: words or typed lines, a machine, and the exact bytes that come back.

usage: transcript.py PROGRAM TRANSCRIPT

    == title of a case
    machine {"Clock": {"Time": 0}}     the machine, as JSON ({"data": "00ff"} is data)
    file /etc/motd some text           a file of the machine; \\n is a newline
    environment TAVISK_LOG=stderr
    $ tavisk -getdate -gettime         the words, quoted as in a shell; starts the run
    < -getdate                         a typed line, in order; `<|` types the text without a newline at the end
    Date: 1/1/1970                     the expected standard output, line by line; `|` at the end: no newline follows
    !error tavisk: what standard error says
    !status 1                          0 when not given
    !machine {"Clock": {"Time": 5}}    what the machine holds afterwards (other keys are not looked at)
    !effects [["Time", "applied"]]     every effect, in order
    !log a line of system.log          every line, in order

\\xNN is that byte, in quoted words, typed lines and expected lines; # begins a comment line before the first case.
"""

import difflib
import json
import re
import shlex
import sys

from machine import ScratchMachine, decoded, program_and_arguments


def bytes_of(text):
    pieces = re.split(rb"\\x([0-9a-fA-F]{2})", text.encode())
    return b"".join(bytes.fromhex(piece.decode()) if odd % 2 else piece for odd, piece in enumerate(pieces))


class Case:
    def __init__(self, title):
        self.title = title
        self.description = None
        self.files = []
        self.environment = {}
        self.words = None
        self.typed = b""
        self.output = b""
        self.errors = []
        self.status = 0
        self.machine = None
        self.effects = None
        self.log = []

    def prepare(self, line):
        keyword, _, rest = line.partition(" ")
        if keyword == "machine":
            self.description = json.loads(rest)
        elif keyword == "file":
            path, _, content = rest.partition(" ")
            self.files.append((path, bytes_of(content.replace("\\n", "\n"))))
        elif keyword == "environment":
            name, _, value = rest.partition("=")
            self.environment[name] = value
        elif keyword == "$":
            self.words = [bytes_of(word) for word in shlex.split(rest)[1:]]
        elif line:
            raise ValueError(f"{self.title}: {line}")

    def expect(self, line):
        if line.startswith("<|"):
            self.typed += bytes_of(line[2:])
        elif line == "<" or line.startswith("< "):
            self.typed += bytes_of(line[2:]) + b"\n"
        elif line.startswith("!"):
            self.require(*line[1:].partition(" ")[::2])
        else:
            self.output += bytes_of(line[:-1]) if line.endswith("|") else bytes_of(line) + b"\n"

    def require(self, what, value):
        if what == "error":
            self.errors.append(value)
        elif what == "log":
            self.log.append(value)
        elif what == "status":
            self.status = int(value)
        else:
            setattr(self, {"machine": "machine", "effects": "effects"}[what], json.loads(value))

    def differences(self, program):
        with ScratchMachine(program, self.description) as machine:
            for path, content in self.files:
                machine.file(path, content)
            output, errors, status = machine.run(self.words, self.typed, self.environment)
            errors = errors.decode(errors="replace").replace(str(machine.directory), "DIR").splitlines()
            yield from compared("output", self.output, output)
            yield from compared("standard error", self.errors, errors)
            yield from compared("status", self.status, status)
            yield from compared("system.log", self.log, machine.lines("system.log"))
            if self.machine is not None:
                yield from compared("machine", decoded(self.machine), held(machine.read(), decoded(self.machine)))
            if self.effects is not None:
                found = [[effect["setting"], effect["outcome"]] for effect in machine.effects()]
                yield from compared("effects", self.effects, found)


def held(machine, asked):
    """The part of the machine that was asked about."""
    if not isinstance(asked, dict) or not isinstance(machine, dict):
        return machine
    return {key: held(machine.get(key), value) for key, value in asked.items()}


def compared(what, expected, found):
    if expected == found:
        return
    yield f"  {what} differs:"
    if isinstance(expected, bytes):
        expected, found = (text.decode(errors="backslashreplace").splitlines(True) for text in (expected, found))
        yield from ("    " + repr(line) for line in difflib.ndiff(expected, found))
    else:
        yield f"    expected {expected!r}"
        yield f"    found    {found!r}"


def read_cases(path):
    cases = []
    with open(path, encoding="utf-8") as transcript:
        lines = transcript.read().splitlines()
    for number, line in enumerate(lines):
        if line.startswith("== "):
            cases.append(Case(line[3:]))
        elif not cases or (line == "" and (number + 1 == len(lines) or lines[number + 1].startswith("== "))):
            continue
        elif cases[-1].words is None:
            cases[-1].prepare(line)
        else:
            cases[-1].expect(line)
    return cases


def main():
    program, (path,) = program_and_arguments(sys.argv)
    cases = read_cases(path)
    assert cases, f"{path}: no cases"
    failed = 0
    for case in cases:
        differences = list(case.differences(program))
        failed += bool(differences)
        if differences:
            print(f"FAILED {case.title}", *differences, sep="\n")
    print(f"{len(cases) - failed} of {len(cases)} cases passed")
    return 1 if failed else 0


if __name__ == "__main__":
    sys.exit(main())

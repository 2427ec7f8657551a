# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Runs transcripts: words or typed lines, a machine, and the exact bytes that come back.

usage: transcript.py PROGRAM TRANSCRIPT

    == title of a case
    machine {"Clock": {"Time": 0}}     the machine, as JSON ({"data": "00ff"} is data)
    file /etc/motd some text           a file of the machine; \\n is a newline
    link /Backup /Volumes/Backup       a symbolic link of the machine
    environment TAVISK_LOG=stderr
    earlier tavisk -setdate 01:01:70   a run before, of which nothing is looked at
    then {"Clock": {"Time": 5}}        what somebody changes in the machine after the last of these
    $ tavisk -getdate -gettime         the program, which lies beside PROGRAM, and its words, quoted as in a shell;
                                       starts the run
    < -getdate                         a typed line, in order; `<|` types the text without a newline at the end
    Date: 1/1/1970                     the expected standard output, line by line; `|` at the end: no newline follows.
                                       DIR is the folder of the machine's files
    !error tavisk: what standard error says
    !status 1                          0 when not given
    !machine {"Clock": {"Time": 5}}    what has changed in the machine, and nothing else; null: what is gone. The
                                       authorization is looked at where it is named
    !plist /etc/a.plist {"Key": 5}     a property list among the machine's files; {}: there is none
    !effects [["Time", "applied"]]     every effect, in order
    !log a line of system.log          every line, in order

Each case is run twice, the second time with a report, whose lines have to be as its schema says.
\\xNN is that byte, in quoted words, typed lines and expected lines; # begins a comment line before the first case.
"""

import copy
import difflib
import json
import os
import re
import shlex
import sys
import tempfile

import reports
from machine import ScratchMachine, merged, program_and_arguments


def bytes_of(text):
    pieces = re.split(rb"\\x([0-9a-fA-F]{2})", text.encode())
    return b"".join(bytes.fromhex(piece.decode()) if odd % 2 else piece for odd, piece in enumerate(pieces))


def value_of(text):
    """JSON to property list."""
    return json.loads(text, object_hook=lambda found: bytes.fromhex(found["data"]) if set(found) == {"data"} else found)


class Case:
    def __init__(self, title):
        self.title = title
        self.description = self.program = self.words = None
        self.files, self.links, self.environment = [], [], {}
        self.earlier, self.changes = [], {}
        self.typed, self.output = b"", b""
        self.wanted = {"error": [], "log": [], "plist": [], "status": ["0"], "machine": ["{}"], "effects": []}

    def prepare(self, line):
        keyword, _, rest = line.partition(" ")
        if keyword == "machine":
            self.description = value_of(rest)
        elif keyword == "file":
            path, _, content = rest.partition(" ")
            self.files.append((path, bytes_of(content.replace("\\n", "\n"))))
        elif keyword == "link":
            self.links.append(rest.split(" "))
        elif keyword == "environment":
            name, _, value = rest.partition("=")
            self.environment[name] = value
        elif keyword == "earlier":
            self.earlier.append([bytes_of(word) for word in shlex.split(rest)])
        elif keyword == "then":
            self.changes = value_of(rest)
        elif keyword == "$":
            self.program, *words = shlex.split(rest)
            self.words = [bytes_of(word) for word in words]
        elif line:
            raise ValueError(f"{self.title}: {line}")

    def expect(self, line):
        if line.startswith("<|"):
            self.typed += bytes_of(line[2:])
        elif line == "<" or line.startswith("< "):
            self.typed += bytes_of(line[2:]) + b"\n"
        elif line.startswith("!"):
            what, _, value = line[1:].partition(" ")
            earlier = self.wanted[what]
            self.wanted[what] = [*earlier, value] if what in ("error", "log", "plist") else [value]
        else:
            self.output += bytes_of(line[:-1]) if line.endswith("|") else bytes_of(line) + b"\n"

    def machines(self, found):
        """The machine as it should be and as it is."""
        changes = value_of(*self.wanted["machine"])
        expected = merged(copy.deepcopy(self.description or {}), changes)
        if "Authorization" not in changes:
            found.pop("Authorization", None)
            expected.pop("Authorization", None)
        return expected, found

    def differences(self, program):
        yield from self.differences_of_run(program, {})
        with tempfile.NamedTemporaryFile("r", errors="replace") as report:
            kept = {"TAVISK_REPORT": report.name}
            yield from (f"{line} (with a report)" for line in self.differences_of_run(program, kept))
            yield from (f"  report: {fault}" for fault in reports.faults(report.read()))

    def differences_of_run(self, program, environment):
        with ScratchMachine(os.path.join(os.path.dirname(program), self.program), self.description) as machine:
            for path, content in self.files:
                machine.file(path, content)
            for path, target in self.links:
                machine.place(path).symlink_to(target)
            for earlier, *words in self.earlier:
                machine.program = os.path.join(os.path.dirname(program), earlier.decode())
                machine.run(words)
            if self.changes:
                machine.change(self.changes)
            machine.program = os.path.join(os.path.dirname(program), self.program)
            output, errors, status = machine.run(self.words, self.typed, {**environment, **self.environment})
            output = output.replace(bytes(machine.directory), b"DIR")
            errors = errors.decode(errors="replace").replace(str(machine.directory), "DIR").splitlines()
            yield from compared("output", self.output, output)
            yield from compared("standard error", self.wanted["error"], errors)
            yield from compared("status", self.wanted["status"], [str(status)])
            yield from compared("system.log", self.wanted["log"], machine.lines("system.log"))
            yield from compared("machine", *self.machines(machine.read()))
            for path, _, content in (wanted.partition(" ") for wanted in self.wanted["plist"]):
                yield from compared(path, value_of(content), machine.read(path))
            yield from (f"  effects.log: {fault}" for fault in reports.faults_of_effects(machine.effects()))
            for wanted in self.wanted["effects"]:
                found = [[effect["setting"], effect["outcome"]] for effect in machine.effects()]
                yield from compared("effects", json.loads(wanted), found)


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

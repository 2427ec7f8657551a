# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A scratch machine in a temporary folder, and runs of the real program on it."""

import json
import os
import pathlib
import plistlib
import shutil
import subprocess
import tempfile

SANITIZER_OPTIONS = {name: value for name, value in os.environ.items() if name.endswith("SAN_OPTIONS")}


def merged(into, changes):
    """Dictionaries key by key; a null removes."""
    for key, value in changes.items():
        if value is None:
            into.pop(key, None)
        elif isinstance(value, dict) and isinstance(into.get(key), dict):
            merged(into[key], value)
        else:
            into[key] = value
    return into


class ScratchMachine:
    def __init__(self, program, description=None):
        self.program = program
        self.directory = pathlib.Path(tempfile.mkdtemp(prefix="tavisk-cli."))
        if description is not None:
            self.write(description)

    def __enter__(self):
        return self

    def __exit__(self, *_):
        shutil.rmtree(self.directory, ignore_errors=True)

    @property
    def plist(self):
        return self.directory / "machine.plist"

    def write(self, description):
        replacement = self.directory / "machine.new"
        replacement.write_bytes(plistlib.dumps(description, sort_keys=False))
        replacement.rename(self.plist)

    def read(self, path=None):
        """The machine, or a property list among its files; {} when there is none."""
        place = self.place(path) if path else self.plist
        return plistlib.loads(place.read_bytes()) if place.exists() else {}

    def change(self, changes):
        self.write(merged(self.read(), changes))

    def place(self, path):
        return self.directory / "root" / path.lstrip("/")

    def file(self, path, content=b""):
        place = self.place(path)
        place.parent.mkdir(parents=True, exist_ok=True)
        place.write_bytes(content)

    def lines(self, name):
        place = self.directory / name
        return place.read_text().splitlines() if place.exists() else []

    def effects(self):
        return [json.loads(line) for line in self.lines("effects.log")]

    def environment(self, **more):
        return {"PATH": "/usr/sbin:/usr/bin:/sbin:/bin", "TAVISK_HOST": f"scratch:{self.directory}", **SANITIZER_OPTIONS, **more}

    def start(self, words, environment=None, **how):
        return subprocess.Popen([self.program, *words], env=self.environment(**(environment or {})), **how)

    def run(self, words, typed=b"", environment=None, **how):
        """Output, standard error and status of one run."""
        ended = subprocess.run([self.program, *words], input=typed, env=self.environment(**(environment or {})), timeout=30,
                               **{"stdout": subprocess.PIPE, "stderr": subprocess.PIPE, **how})
        return ended.stdout, ended.stderr, ended.returncode


def program_and_arguments(arguments):
    """The program's path is the first argument of every test here."""
    return os.path.abspath(arguments[1]), arguments[2:]

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Holds reports to their schema.

usage: reports.py TESTS [ARGUMENT ...]   those that these tests leave where TAVISK_KEPT_REPORTS says
"""

import json
import os
import pathlib
import re
import subprocess
import sys
import tempfile

import jsonschema

_PACKAGING = pathlib.Path(__file__).parents[2] / "packaging"
SCHEMA = json.loads((_PACKAGING / "report.schema.json").read_text())
RECIPE_SETS = "-settimezone Europe/Paris"
_OBJECTS = jsonschema.Draft202012Validator(SCHEMA)
_EFFECTS = jsonschema.Draft202012Validator({"$defs": SCHEMA["$defs"], "$ref": "#/$defs/effect"})
# What an effect has in an effects.log besides.
_RECORD = jsonschema.Draft202012Validator({
    "required": ["changed", "run", "time"], "additionalProperties": False,
    "properties": {"changed": {"type": "boolean"}, "run": {"type": "string", "minLength": 1}, "time": {"type": "integer"},
                   "beforeUnknown": {"const": True}}})


def _wrong(validator, found):
    return [f"{'/'.join(map(str, error.absolute_path))}: {error.message[:400]} in {json.dumps(found)[:600]}"
            for error in validator.iter_errors(found)]


def faults(text):
    """What is wrong with the lines of a report."""
    whole, _, rest = text.rpartition("\n")
    found = [f"half a line: {rest}"] if rest else []
    for line in whole.split("\n") if whole else []:
        try:
            found += _wrong(_OBJECTS, json.loads(line))
        except ValueError as error:
            found.append(f"{error}: {line[:600]}")
    return found


def faults_of_effects(effects):
    """What is wrong with the objects of an effects.log."""
    record = lambda effect: {name: effect[name] for name in _RECORD.schema["properties"] if name in effect}
    return [fault for effect in effects for fault in _wrong(_RECORD, record(effect)) +
            _wrong(_EFFECTS, {name: effect[name] for name in effect if name not in record(effect)})]


def recipe(words=RECIPE_SETS):
    """The manual's recipe for scripts, with these words."""
    manual = (_PACKAGING / "man/tavisk.8").read_text().replace("\\-", "-").replace("\\(aq", "'")
    shown = re.search(r"^\.SH EXIT STATUS\n.*?^\.EX\n(.*?)\n\.EE", manual, re.MULTILINE | re.DOTALL)[1]
    assert RECIPE_SETS in shown
    return shown.replace(RECIPE_SETS, words)


def main(command):
    with tempfile.NamedTemporaryFile("r", errors="replace") as kept:
        subprocess.run(command, env={**os.environ, "TAVISK_KEPT_REPORTS": kept.name}, check=True)
        text = kept.read()
    wrong = faults(text) if text else ["no report was kept"]
    print("\n".join(wrong) or "every report is as its schema says")
    return 1 if wrong else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))

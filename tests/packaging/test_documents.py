# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Holds the manual and the package's scripts to the program.

usage: test_documents.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import json
import os
import pathlib
import re
import shutil
import subprocess
import sys
import tempfile
import unittest

PROGRAM, DOCUMENTS, SOURCES = map(pathlib.Path, sys.argv[1:4])
MANUAL = (SOURCES / "packaging/man/tavisk.8").read_text().replace("\\-", "-").replace("\\(rs", "\\").replace("\\(aq", "'")
NOT_IN_HELP = ["-getkernelbootarchitecturesetting", "-setkernelbootarchitecture"]


def section(name, text=MANUAL):
    return re.search(rf'^\.SH "?{name}"?\n(.*?)(?=^\.SH|\Z)', text, re.MULTILINE | re.DOTALL)[1]


def run(command, typed="", machine=None, description="<dict/>"):
    """A run on one of the example machines, or on one that is described."""
    with tempfile.TemporaryDirectory() as folder:
        pathlib.Path(folder, "machine.plist").write_text(description)
        if machine:
            shutil.copytree(machine, folder, dirs_exist_ok=True)
        environment = {"PATH": f"{PROGRAM.parent}:{os.environ['PATH']}", "TAVISK_HOST": f"scratch:{folder}"}
        return subprocess.run(command, env={**os.environ, **environment}, input=typed, capture_output=True, text=True,
                              timeout=20)


class Manual(unittest.TestCase):
    def test_tells_each_command_with_its_argument(self):
        told = re.findall(r'^\.BI? "?(-\w+)( [^\n"]*)?"?', section("COMMANDS"), re.MULTILINE)
        known = re.findall(r"^tavisk (-\w+)", run(["tavisk", "-printCommands"]).stdout, re.MULTILINE)
        self.assertEqual(sorted(word for word, _ in told), sorted([*known, *NOT_IN_HELP]))
        for word, argument in told:
            self.assertEqual(bool(argument), word.startswith("-set"), word)

    def test_lists_the_files_that_purging_removes(self):
        purged = re.search(r"own_files='\n(.*?)\n'", (SOURCES / "debian/tavisk.postrm").read_text(), re.DOTALL)[1]
        listed = re.findall(r"^\.I (/.*)$", section("FILES").split("Purging also")[0], re.MULTILINE)
        self.assertEqual(listed, purged.split())

    def test_lists_the_files_that_the_program_writes(self):
        literals = re.compile(r'"(/[^"\s]*60-tavisk[^"\s]*)"')
        written = {path for source in (SOURCES / "src/hosts/linux").rglob("*.h")
                   for path in literals.findall(source.read_text())}
        self.assertTrue(written)
        for path in written:
            self.assertIn(path, section("FILES"))


class Installed(unittest.TestCase):
    def test_documents_name_what_is_there(self):
        with tempfile.TemporaryDirectory() as tree:
            subprocess.run(["cmake", "--install", DOCUMENTS.parent, "--prefix", "/usr"], env={**os.environ, "DESTDIR": tree},
                           stdout=subprocess.DEVNULL, check=True)
            top = pathlib.Path(tree)
            self.assertEqual(os.readlink(top / "usr/sbin/tavisk"), "../bin/tavisk")
            self.assertTrue(os.access(top / "usr/sbin/tavisk", os.X_OK))
            folder = top / "usr/share/doc/tavisk"
            self.assertEqual(sorted(path.name for path in folder.iterdir()), ["README.md", "SECURITY.md", "examples"])
            for page in (*folder.glob("*.md"), *folder.glob("examples/*"), *(top / "usr/share/man").rglob("tavisk*")):
                text = page.read_text().replace("\\-", "-") if page.is_file() else ""
                for name in re.findall(r"/usr/share/(?:doc/)?tavisk/[\w./-]*\w", text):
                    self.assertTrue((top / name[1:]).exists(), (page, name))
                for name in re.findall(r"`([\w./-]+)`", text):
                    self.assertTrue((folder / name).exists() or not (SOURCES / name).exists(), (page, name))

    def test_manual_tells_each_member_of_the_report_and_each_setting(self):
        def names(part):
            own = list(part.get("properties", {})) if isinstance(part, dict) else []
            return own + [name for below in part.values() for name in names(below)] if isinstance(part, dict) else own

        schema = json.loads((SOURCES / "packaging/report.schema.json").read_text())
        told = set(re.findall(r"\w+", section("REPORT")))
        self.assertEqual(set(names(schema)) - told, set())
        settings = re.findall(r'constexpr const char\* \w+ = "(.*)";', (SOURCES / "src/effects/SettingNames.h").read_text())
        page = (DOCUMENTS / "share/man/man5/tavisk-machine.5").read_text().replace("\\-", "-").splitlines()
        self.assertEqual({f"{name}NAME" if name.endswith(" ") else name for name in settings} - set(page), {"Files"})


class ExampleMachines(unittest.TestCase):
    def test_answer_as_the_manual_shows(self):
        page = (DOCUMENTS / "share/man/man5/tavisk-machine.5").read_text().replace("\\-", "-")
        for machine in (SOURCES / "packaging/machines").iterdir():
            answer = run(["tavisk", "-liststartupdisks", "-gettimezone"], machine=machine)
            *disks, zone = answer.stdout.splitlines()
            self.assertEqual((answer.stderr, answer.returncode, zone[:11]), ("", 0, "Time Zone: "), machine)
            if machine.name == "two-systems":
                self.assertIn("\n".join(["-liststartupdisks", *disks, ".EE"]), page)


class Readme(unittest.TestCase):
    def test_session_at_the_prompt_goes_as_shown(self):
        readme = (SOURCES / "README.md").read_text()
        session = re.search(r"^    > tavisk\n.*?^    > quit\n", readme, re.MULTILINE | re.DOTALL)[0]
        shown = re.sub("^    ", "", session, flags=re.MULTILINE)
        typed = re.findall(r"^> (.*)\n", shown, re.MULTILINE)[2:]
        printed = run(["tavisk"], "\n".join(typed) + "\n", SOURCES / "packaging/machines/rack-server").stdout
        for line in typed:
            shown = shown.replace(f"> {line}\n", "> ", 1)
        self.assertEqual(printed, shown)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])

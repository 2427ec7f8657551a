# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The module for Ansible on scratch machines, and the play of its README on a rack of them.

usage: test_collection.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import importlib.util
import json
import os
import pathlib
import re
import shutil
import subprocess
import sys
import tempfile
import unittest

sys.path.append(str(pathlib.Path(__file__).parents[1] / "cli"))
from machine import ScratchMachine  # noqa: E402

sys.path.append("/usr/lib/python3/dist-packages")  # Debian's Ansible, whichever Python this is
sys.dont_write_bytecode = True

PROGRAM, SOURCES = (pathlib.Path(sys.argv[number]) for number in (1, 3))
COLLECTION = SOURCES / "packaging/ansible"
MODULE = COLLECTION / "plugins/modules/machine.py"
PYTHON = "/usr/bin/python3"
SYSTEM_PATH = "/usr/sbin:/usr/bin:/sbin:/bin"
RACK = ["web-1", "web-2", "db-1"]
ON = {"Remote Shell": {"Enabled": True}}
WITH_TIMERS = {"Power Sources": {"AC Power": {"Display Sleep": 10, "Wake On LAN": True}}}
DAMAGED = {"Refusals": {"Time Zone": "the rules are damaged"}}

# A machine, what is asked for; which settings change, and what the task complains of: the same in check mode.
CASES = [
    ({}, {"Time Zone": "Europe/Paris", "displaysleep": "15"}, {}, ["Time Zone", "Display Sleep"], ""),
    (WITH_TIMERS, {"Display Sleep": False, "Wake On Network Access": True}, {}, ["Display Sleep"], ""),
    (WITH_TIMERS, {"Display Sleep": {"supported": True, "live": "10", "unit": "minutes"}}, {}, [], ""),
    ({}, {"Display Sleep": 200, "Computer Name": "a"}, {}, ["Computer Name"], "Display Sleep: refused: expected is a number .*"),
    ({}, {"Display Sleep": 20, "Wake On Modem": True}, {}, ["Display Sleep"], "Wake On Modem: not supported: .*cannot have .*"),
    ({}, {"Display Sleep": 20, "Wake On Modem": True}, {"skip_unsupported": True}, ["Display Sleep"], ""),
    (DAMAGED, {"Time Zone": "Etc/UTC", "Remote Events": "True"}, {"skip_unsupported": True}, ["Remote Events"],
     "Time Zone: failed: .*: the rules are damaged"),
    (ON, {"Remote Login": False}, {"allow_lockout": True}, ["Remote Login"], ""),
    (ON, {"Remote Login": False, "Time Zone": "Etc/UTC"}, {}, None, ".*Remote Login is not turned off without .*allow.lockout.*"),
    ({}, {"Remote Login": False}, {}, [], ""),
    ({}, {"Time Zone": "Etc/UTC", "timezone": "Etc/UTC"}, {}, None, ".*Time Zone stands there twice"),
    ({}, {"Time": None}, {}, None, '.*Time: a number of seconds since 1970, or a text .*'),
    ({}, None, {}, None, "nothing is asked for.*"),
]


def ask(machine, arguments, path=f"{PROGRAM.parent}:{SYSTEM_PATH}"):
    """What the module answers, run as Ansible runs it on a server."""
    ended = subprocess.run([PYTHON, MODULE], input=json.dumps({"ANSIBLE_MODULE_ARGS": arguments}), capture_output=True, text=True,
                           env=machine.environment(PATH=path), timeout=30)
    return json.loads(ended.stdout)


class Module(unittest.TestCase):
    def test_does_what_check_mode_foretells_and_then_nothing_more(self):
        for description, settings, options, changes, complaint in CASES:
            with self.subTest(settings=settings, options=options), ScratchMachine(PROGRAM, description) as machine:
                arguments = {"settings": settings, "_ansible_diff": True, **options}
                foretold = ask(machine, {**arguments, "_ansible_check_mode": True})
                self.assertEqual(machine.read(), description)
                done = ask(machine, arguments)
                for answer in (foretold, done):
                    self.assertEqual(answer.get("failed", False), bool(complaint), answer)
                    self.assertRegex(answer.get("msg", ""), f"^{complaint}$")
                    self.assertEqual(changed(answer), changes, answer)
                self.assertEqual(done.get("diff"), foretold.get("diff"))
                self.assertEqual(changed(ask(machine, arguments)), changes and [])

    def test_shows_the_difference_with_units_and_what_comes_later(self):
        until_restart = {**WITH_TIMERS, "Network Time": {"Running": True}}
        wanted = {"Display Sleep": 20, "Computer Name": "a", "Wake On Network Access": "on", "Network Time": "on"}
        with ScratchMachine(PROGRAM, until_restart) as machine:
            answers = [ask(machine, {"settings": wanted, "_ansible_diff": True, "_ansible_check_mode": is_check})
                       for is_check in (True, False)]
        for answer in answers:
            self.assertEqual(answer["diff"], {
                "before": {"Display Sleep": "10 minutes", "Computer Name": None, "Network Time": "on, after a restart off"},
                "after": {"Display Sleep": "20 minutes", "Computer Name": "a", "Network Time": "on"}})

    def test_fails_for_what_does_not_last(self):
        setting = {"setting": "Time Zone", "outcome": "applied", "lasts": False, "after": "a", "stored": "b", "changed": True}
        module = loaded_module()
        self.assertEqual(module.fault(setting, True), "Time Zone: does not last over a restart: it will be b")
        self.assertEqual(module.fault({**setting, "undone_by": "cloud-init"}, True),
                         "Time Zone: does not last over a restart: may be undone by cloud-init")

    def test_gathers_facts_and_warns_of_what_cannot_be_read(self):
        with ScratchMachine(PROGRAM, {**WITH_TIMERS, "Refusals": {"Computer Name (read)": "the line is down"}}) as machine:
            answer = ask(machine, {"settings": {"Display Sleep": 20}, "gather": True})
        facts = answer["ansible_facts"]["tavisk"]["settings"]
        # Ansible 2.19 has an object of each.
        warnings = [text if isinstance(text, str) else text["event"]["msg"] for text in answer["warnings"]]
        self.assertEqual((facts["Display Sleep"]["live"], warnings),
                         ("20", ["Computer Name: read on the rehearsed machine: the line is down"]))
        self.assertFalse(answer.get("failed"))

    def test_tells_what_was_changed_when_facts_cannot_be_gathered(self):
        with ScratchMachine(PROGRAM, {}) as machine, tempfile.TemporaryDirectory() as folder:
            program = pathlib.Path(folder, "taviskctl")
            program.write_text(f"""#!/bin/sh
[ "$1" != status ] || {{ echo "the machine is gone" >&2; exit 1; }}
exec {PROGRAM.parent}/taviskctl "$@"
""")
            program.chmod(0o755)
            answer = ask(machine, {"settings": {"Display Sleep": 20, "Computer Sleep": 200}, "gather": True},
                         path=f"{folder}:{SYSTEM_PATH}")
        self.assertEqual(changed(answer), ["Display Sleep"])
        self.assertRegex(answer["msg"], "^Computer Sleep: refused: .*; the machine is gone$")

    def test_says_what_is_not_installed_and_who_may_not(self):
        with ScratchMachine(PROGRAM, {"User": {"ID": 1000}}) as machine:
            self.assertIn("Debian package tavisk", ask(machine, {"gather": True}, path=SYSTEM_PATH)["msg"])
            self.assertIn("not an administrator", ask(machine, {"settings": {"Time Zone": "Etc/UTC"}})["msg"])


def changed(answer):
    """None: it was not looked at."""
    told = answer.get("settings")
    names = None if told is None else [setting["setting"] for setting in told if setting["changed"]]
    assert answer.get("changed", False) == bool(names), answer
    return names


def loaded_module():
    found = importlib.util.spec_from_file_location("module_of_collection", MODULE)
    module = importlib.util.module_from_spec(found)
    found.loader.exec_module(module)
    return module


class Collection(unittest.TestCase):
    def setUp(self):
        self._folder = tempfile.TemporaryDirectory()
        self.addCleanup(self._folder.cleanup)
        self.folder = pathlib.Path(self._folder.name)
        shutil.copytree(COLLECTION, self.folder / "ansible_collections/tavisk/settings")
        self.environment = {"PATH": SYSTEM_PATH, "HOME": str(self.folder), "ANSIBLE_COLLECTIONS_PATH": str(self.folder),
                            "LC_ALL": "C.UTF-8", "ANSIBLE_NOCOLOR": "1", "ANSIBLE_LOCALHOST_WARNING": "0"}

    def run_tool(self, *words):
        ended = subprocess.run(words, env=self.environment, cwd=self.folder, stdin=subprocess.DEVNULL, capture_output=True,
                               text=True, timeout=100)
        self.assertEqual(ended.returncode, 0, ended.stdout + ended.stderr)
        return ended.stdout

    def test_tells_every_option_as_the_module_takes_it(self):
        told = json.loads(self.run_tool("ansible-doc", "--json", "tavisk.settings.machine"))["tavisk.settings.machine"]
        options = {name: {key: option[key] for key in ("type", "default") if option.get(key) is not None}
                   for name, option in told["doc"]["options"].items()}
        self.assertEqual(options, loaded_module().ARGUMENTS)
        self.assertTrue(told["examples"] and told["return"])

    def test_is_of_the_version_of_the_package(self):
        changelog = (SOURCES / "debian/changelog").read_text()
        number, stage = re.match(r"tavisk \((\d+\.\d+)(?:~(\w+))?-", changelog).groups()
        version = f"{number}.0-{stage}" if stage else f"{number}.0"
        self.assertIn(f"\nversion: {version}\n", (COLLECTION / "galaxy.yml").read_text())

    def test_the_play_of_the_readme_settles_a_rack(self):
        play = re.search(r"```yaml\n(.*?)```", (COLLECTION / "README.md").read_text(), re.DOTALL)[1]
        shown = re.search(r"```yaml\n(.*?)```", (SOURCES / "README.md").read_text(), re.DOTALL)[1]
        self.assertLessEqual({line.strip(" -") for line in shown.splitlines()}, {line.strip(" -") for line in play.splitlines()})
        (self.folder / "rack.yml").write_text(play)
        machines = {name: self.server(name) for name in RACK}
        (self.folder / "rack").write_text("[rack]\n" + "".join(
            f"{name}.rack.example ansible_connection=local ansible_become=false ansible_python_interpreter={self.folder}/{name}\n"
            for name in RACK))
        for options, changes in ((["--check", "--diff"], 1), (["--diff"], 1), ([], 0)):
            said = self.run_tool("ansible-playbook", "-i", "rack", "rack.yml", *options)
            self.assertEqual([int(number) for number in re.findall(r"changed=(\d+)", said)], [changes] * len(RACK), said)
        told = [self.told(machine) for machine in machines.values()]
        self.assertEqual(told, [("web-1", "web-1.rack.example", "time-1.rack.example", b"\0"),
                                ("web-2", "web-2.rack.example", "time-2.rack.example", b"\1"),
                                ("db-1", "db-1.rack.example", "time-1.rack.example", b"\2")])

    def server(self, name):
        """A scratch machine with a controller, which the server's own interpreter leads to."""
        machine = ScratchMachine(PROGRAM, {"Power Sources": {"AC Power": {"Auto Restart": False}},
                                           "Registry": {"Services": {"VelmarSMU": {"ServerID": b"\5"}}}})
        self.addCleanup(machine.__exit__)
        environment = " ".join(f"{key}='{value}'" for key, value in
                               machine.environment(PATH=f"{PROGRAM.parent}:{SYSTEM_PATH}").items())
        script = self.folder / name
        script.write_text(f'#!/bin/sh\nexec env {environment} {PYTHON} "$@"\n')
        script.chmod(0o755)
        return machine

    @staticmethod
    def told(machine):
        found = machine.read()
        names = found["Host Configuration"]
        return (names["Computer Name"], names["Local Host Name"], found["Network Time"]["Server"],
                found["Registry"]["Services"]["VelmarSMU"]["ServerID"])


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1])

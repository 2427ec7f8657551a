# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What the package lets whom do without root's password: polkit's file of defaults, and its rules in polkit's own language.

usage: test_polkit.py PROGRAM FILLED-DOCUMENTS SOURCES
"""

import json
import pathlib
import shutil
import subprocess
import sys
import unittest
import xml.etree.ElementTree

PACKAGING = pathlib.Path(sys.argv[3], "packaging")
UNITS = "org.freedesktop.systemd1.manage-units"
# What polkitd gives to rules.
POLKIT = """var rules = [];
var polkit = { Result: { YES: "yes", AUTH_SELF_KEEP: "by own password", NOT_HANDLED: "as by default" },
               addRule: function(rule) { rules.push(rule); } };
"""
ANSWERS = """
print(JSON.stringify(CASES.map(function(row) {
  var action = { id: row[1], lookup: function(key) { return { unit: row[2], verb: row[3] }[key]; } };
  var subject = { isInGroup: function(group) { return group === row[0]; } };
  return rules.map(function(rule) { return rule(action, subject); }).filter(function(answer) {
    return answer !== "as by default";
  })[0] || "as by default";
})));
"""
# Group, action, unit and verb; and the answer.
CASES = [
    (("admin", "org.tavisk.manage"), "by own password"),
    (("users", "org.tavisk.manage"), "as by default"),
    (("admin", UNITS, "ssh.service", "stop"), "yes"),
    (("admin", UNITS, "sshd.socket", "start"), "yes"),
    (("admin", UNITS, "chrony.service", "try-restart"), "yes"),
    (("admin", UNITS, "ssh.service", "try-restart"), "as by default"),
    (("admin", UNITS, "ssh.service", "kill"), "as by default"),
    (("admin", UNITS, "cron.service", "stop"), "as by default"),
    (("admin", UNITS), "as by default"),
    (("users", UNITS, "ssh.service", "stop"), "as by default"),
    (("admin", "org.freedesktop.systemd1.manage-unit-files", "ssh.service", "stop"), "as by default"),
]


class Polkit(unittest.TestCase):
    def test_asks_everybody_for_a_password_that_lasts_for_the_run(self):
        (action,) = xml.etree.ElementTree.parse(PACKAGING / "org.tavisk.policy").iter("action")
        self.assertEqual({default.tag: default.text for default in action.find("defaults")},
                         dict.fromkeys(["allow_any", "allow_inactive", "allow_active"], "auth_admin_keep"))

    def test_lets_members_of_the_group_have_units_of_its_settings_alone(self):
        script = POLKIT + (PACKAGING / "org.tavisk.rules").read_text() + "var CASES = " + json.dumps([row for row, _ in CASES])
        asked = subprocess.run(["duk", "/dev/stdin"], input=script + ANSWERS, capture_output=True, text=True, timeout=20)
        self.assertEqual(asked.stderr, "")
        self.assertEqual(list(zip((row for row, _ in CASES), json.loads(asked.stdout))), CASES)


if __name__ == "__main__":
    if not shutil.which("duk"):
        print("skipped: there is no duk, which has polkit's language")
        sys.exit(77)
    unittest.main(argv=sys.argv[:1])

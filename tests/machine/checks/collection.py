# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The module for Ansible, run as Ansible does it on a server, for settings that a container cannot have."""

import json
import re

from check import Check
from checks.sleep_timers import idle
from checks.startup_delay import kept

NEEDS = frozenset({"server", "ansible-collection-tavisk-settings"})
MODULE = "/usr/share/ansible/collections/ansible_collections/tavisk/settings/plugins/modules/machine.py"
SHOW = """import json
told = json.load(open("/run/told"))
print(told.get("changed"), told.get("msg", "done"))
for setting in told.get("settings", []):
    print(setting["setting"], setting["outcome"], setting.get("after"))
"""
WANTED = {"Network Time Server": "time.rack.example", "Network Time": True, "Startup Delay": "60", "Computer Sleep": 40,
          "Display Sleep": False}
RESULT = ("Network Time Server {0} time.rack.example\nNetwork Time (applied|unchanged) on\nComputer Sleep {0} 40\n"
          "Display Sleep {0} 0\nStartup Delay {0} 2\n")
BEFORE = ("tavisk -setnetworktimeserver 192.0.2.9 -setwaitforstartupafterpowerfailure 30 -setcomputersleep 5 "
          "-setdisplaysleep 5 >/dev/null; ")
AS_WANTED = kept(60) | idle("suspend", 40) | {"tavisk -getnetworktimeserver": "Network Time Server: time.rack.example\n"}
# What it has told of settings is given back to them.
GIVE_BACK = """import json
told = json.load(open("/run/told"))["ansible_facts"]["tavisk"]["settings"]
wanted = {name: told[name] for name in ("Network Time Server", "Startup Delay", "Computer Sleep", "Display Sleep")}
json.dump({"ANSIBLE_MODULE_ARGS": {"settings": wanted}}, open("/run/asked", "w"))
"""


def run(arguments):
    asked = json.dumps({"ANSIBLE_MODULE_ARGS": arguments})
    return f"cat >/run/asked <<'END'\n{asked}\nEND\npython3 {MODULE} </run/asked >/run/told\n"


def shown(arguments):
    return run(arguments) + f"python3 -c '{SHOW}'; "


CHECKS = [
    Check("check mode foretells what the module will do, and does nothing", needs=NEEDS,
          do=BEFORE + run({"gather": True}) + "cp /run/told /run/gathered; touch /run/mark; sleep 0.1\n" +
             shown({"settings": WANTED, "_ansible_check_mode": True}) + "find /etc -newer /run/mark",
          prints=re.compile("True done\n" + RESULT.format("applied")), then=kept(30) | idle("suspend", 5)),
    Check("the module does it", needs=NEEDS, do=shown({"settings": WANTED}), then=AS_WANTED,
          prints=re.compile("True done\n" + RESULT.format("applied"))),
    Check("the module changes nothing then", needs=NEEDS, do="touch /run/mark; sleep 0.1\n" + shown({"settings": WANTED}) +
          "find /etc -newer /run/mark", prints=re.compile("False done\n" + RESULT.format("unchanged")), then=AS_WANTED),
    Check("what the module gathered it takes", needs=NEEDS,
          do=f"cp /run/gathered /run/told; python3 -c '{GIVE_BACK}'; python3 {MODULE} </run/asked >/run/told; python3 -c '{SHOW}'",
          prints="True done\nNetwork Time Server applied 192.0.2.9\nComputer Sleep applied 5\nDisplay Sleep applied 5\n"
                 "Startup Delay applied 1\n", then=kept(30)),
]

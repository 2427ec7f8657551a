# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CONTAINER = frozenset({"container"})
SERVER = frozenset({"server"})
FILE = "/etc/tavisk/preferences/AnyApplication.plist"
SETTING = "disablekeyboardwhenenclosurelockisengaged"
STORED = f"tr -d '\\n\\t' <{FILE} | grep -o '<key>DunmereLockEnclosureState</key><[a-z]*/>'"

# Of the emulated server's keyboard, and of its buttons.
INHIBITED = "for i in /sys/class/input/input*; do echo $(cat $i/name $i/inhibited); done | grep -E -i 'keyboard|power' | sort"
ENABLED = "AT Translated Set 2 keyboard 0\nPower Button 0\n"
DISABLED = "AT Translated Set 2 keyboard 1\nPower Button 0\n"
SET = f"rm -f /run/report; TAVISK_LOG=stderr TAVISK_REPORT=/run/report tavisk -set{SETTING} {{}}; " \
      "grep -o 'the lock is [a-z]*' /run/report"


def set_to(word, told):
    return {"do": SET.format(word), "prints": f"set{SETTING}: {word}\n{told}\n", "errors": ""}


CHECKS = [
    Check("without a lock the report says so, beside the preference", needs=CONTAINER,
          do=f"rm -f /run/report; TAVISK_LOG=stderr TAVISK_REPORT=/run/report tavisk -get{SETTING}; "
             "grep -o '\"setting\":\"Keyboard Lock\",\"supported\":false' /run/report; grep -c '\"effects\":\\[\\]' /run/report",
          prints=re.compile(f'get{SETTING}: (Yes|No)\n"setting":"Keyboard Lock","supported":false\n1\n'), errors=""),
    Check("without a lock the preference is kept, and that is told", needs=CONTAINER,
          do=f"rm -rf /etc/tavisk/preferences; TAVISK_LOG=stderr tavisk -get{SETTING} -set{SETTING} yes",
          prints=f"get{SETTING}: No\nset{SETTING}: Yes\n", errors=re.compile(r"tavisk: Keyboard Lock: [^\n]*\n"),
          then={STORED: "<key>DunmereLockEnclosureState</key><true/>\n"}),
    Check("what could not be written is not told as kept", needs=CONTAINER, status=0,
          do=f"rm -rf /etc/tavisk/preferences; mkdir -p /etc/tavisk; touch /etc/tavisk/preferences; rm -f /run/report; TAVISK_REPORT=/run/report "
             f"tavisk -set{SETTING} yes; rm /etc/tavisk/preferences; grep -o kept /run/report; "
             "grep -o '\"outcome\":\"[a-z ]*\"' /run/report",
          prints=f'set{SETTING}: Yes\n"outcome":"not supported"\n"outcome":"failed"\n'),
    Check("the preference is kept", needs=CONTAINER, kept=True, do=f"tavisk -set{SETTING} On",
          prints=f"set{SETTING}: Yes\n",
          then={f"tavisk -get{SETTING}": f"get{SETTING}: Yes\n", STORED: "<key>DunmereLockEnclosureState</key><true/>\n"}),
    Check("the front panel is locked", needs=SERVER, do="controller is locked", then={INHIBITED: ENABLED}),
    Check("the keyboard is disabled while the panel is locked", needs=SERVER, then={INHIBITED: DISABLED},
          **set_to("Yes", "the lock is engaged")),
    Check("the keyboard is enabled although the panel is locked", needs=SERVER, then={INHIBITED: ENABLED},
          **set_to("No", "the lock is engaged")),
    Check("the front panel is opened", needs=SERVER, do="controller is open"),
    Check("the keyboard stays enabled while the panel is open", needs=SERVER, then={INHIBITED: ENABLED},
          **set_to("Yes", "the lock is open")),
]

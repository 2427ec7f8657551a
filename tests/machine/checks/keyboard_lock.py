# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CONTAINER = frozenset({"container"})
FILE = "/etc/tavisk/preferences/AnyApplication.plist"
SETTING = "disablekeyboardwhenenclosurelockisengaged"
STORED = f"tr -d '\\n\\t' <{FILE} | grep -o '<key>DunmereLockEnclosureState</key><[a-z]*/>'"

CHECKS = [
    Check("without a lock the preference is kept, and that is told", needs=CONTAINER,
          do=f"rm -rf /etc/tavisk/preferences; TAVISK_LOG=stderr tavisk -get{SETTING} -set{SETTING} yes",
          prints=f"get{SETTING}: No\nset{SETTING}: Yes\n", errors=re.compile(r"tavisk: Keyboard Lock: [^\n]*\n"),
          then={STORED: "<key>DunmereLockEnclosureState</key><true/>\n"}),
    Check("runs that set it at the same time lose nothing", needs=CONTAINER,
          do=f"for i in 1 2 3 4; do tavisk -set{SETTING} yes -set{SETTING} no & done >/dev/null; wait; "
             f"{STORED}; ls -A /etc/tavisk/preferences",
          prints="<key>DunmereLockEnclosureState</key><false/>\n.lock\nAnyApplication.plist\n"),
    Check("the preference is kept", needs=CONTAINER, kept=True, do=f"tavisk -set{SETTING} On",
          prints=f"set{SETTING}: Yes\n",
          then={f"tavisk -get{SETTING}": f"get{SETTING}: Yes\n", STORED: "<key>DunmereLockEnclosureState</key><true/>\n"}),
]

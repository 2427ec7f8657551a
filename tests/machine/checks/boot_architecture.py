# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
from check import Check

CONTAINER = frozenset({"container"})
FOLDER = "/Library/Preferences/SystemConfiguration"
FILE = f"{FOLDER}/com.velmar.Boot.plist"
OTHERS = "<key>Timeout</key><integer>5</integer><key>Kernel</key><data>AP8=</data>"
SAVED = "changes to kernel architecture have been saved.\n"


CHECKS = [
    Check("what has no file to be set back in is told as refused", needs=CONTAINER,
          do="rm -rf /Library; rm -f /run/report; TAVISK_REPORT=/run/report tavisk -setkernelbootarchitecture default; "
             "grep -o '\"refused\":\"[a-z0-9]*' /run/report",
          prints='setting kernel architecture to default\nchanges to kernel architecture failed to save!\n"refused":"i386\n',
          then={"ls /Library 2>&1 | grep -c 'No such'": "1\n"}),
    Check("the boot loader's file is made with its folders", needs=CONTAINER,
          do="rm -rf /Library; tavisk -setkernelbootarchitecture i386",
          prints="setting kernel architecture to: i386\n" + SAVED,
          then={f"tr -d '\\n\\t' <{FILE} | grep -o '<dict>.*</dict>'":
                "<dict><key>Kernel Architecture</key><string>i386</string></dict>\n",
                f"stat -c '%a %U' {FOLDER} {FILE}": "755 root\n644 root\n"}),
    Check("the architecture is stored beside other keys, and nothing is said to read it", needs=CONTAINER, kept=True,
          do=f"printf '%s' '<dict>{OTHERS}</dict>' >{FILE}; rm -f /run/report; "
             "TAVISK_REPORT=/run/report tavisk -setkernelbootarchitecture x86_64; grep -o 'no boot loader here reads it' /run/report",
          prints="setting kernel architecture to: x86_64\n" + SAVED + "no boot loader here reads it\n",
          then={"tavisk -getkernelbootarchitecturesetting": "kernel architecture is set to: x86_64\n",
                f"tr -d '\\n\\t' <{FILE} | grep -o '<dict>.*</dict>'":
                f"<dict>{OTHERS}<key>Kernel Architecture</key><string>x86_64</string></dict>\n"}),
]

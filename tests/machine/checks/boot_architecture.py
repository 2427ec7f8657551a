# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

CONTAINER = frozenset({"container"})
FOLDER = "/Library/Preferences/SystemConfiguration"
FILE = f"{FOLDER}/com.velmar.Boot.plist"
OTHERS = "<key>Timeout</key><integer>5</integer><key>Kernel</key><data>AP8=</data>"
SAVED = "changes to kernel architecture have been saved.\n"
FAILED = "changes to kernel architecture failed to save!\n"


def put(text):
    return f"mkdir -p {FOLDER}; printf '%s' '{text}' >{FILE}; "


CHECKS = [
    Check("without the boot loader's file there is no default to save", needs=CONTAINER,
          do="rm -rf /Library; tavisk -getkernelbootarchitecturesetting -setkernelbootarchitecture default",
          prints="kernel architecture is set to default\nsetting kernel architecture to default\n" + FAILED,
          then={"test -e /Library || echo absent": "absent\n"}),
    Check("the boot loader's file is made with its folders", needs=CONTAINER,
          do="rm -rf /Library; tavisk -setkernelbootarchitecture i386",
          prints="setting kernel architecture to: i386\n" + SAVED,
          then={f"tr -d '\\n\\t' <{FILE} | grep -o '<dict>.*</dict>'":
                "<dict><key>Kernel Architecture</key><string>i386</string></dict>\n",
                f"stat -c '%a %U' {FOLDER} {FILE}": "755 root\n644 root\n"}),
    Check("what is no property list is kept beside", needs=CONTAINER,
          do=put("i386") + "tavisk -setkernelbootarchitecture i386", prints="setting kernel architecture to: i386\n" + SAVED,
          then={f"cat {FILE}.damaged": "i386"}),
    Check("a file that cannot be replaced is told, and still whole", needs=CONTAINER,
          do=put(f"<dict>{OTHERS}</dict>") + f"mount --bind {FOLDER} {FOLDER}; mount -o remount,bind,ro {FOLDER}; "
             f"TAVISK_LOG=stderr tavisk -setkernelbootarchitecture i386; umount {FOLDER}",
          prints="setting kernel architecture to: i386\n" + FAILED,
          errors=re.compile(r"tavisk: Kernel Architecture: [^\n]*Read-only file system\n"),
          then={f"cat {FILE}": f"<dict>{OTHERS}</dict>"}),
    Check("the architecture is stored beside other keys, and nothing is said to read it", needs=CONTAINER, kept=True,
          do=put(f"<dict>{OTHERS}</dict>") + "rm -f /run/report; TAVISK_REPORT=/run/report tavisk -setkernelbootarchitecture "
             "x86_64; grep -o 'no boot loader here reads it' /run/report",
          prints="setting kernel architecture to: x86_64\n" + SAVED + "no boot loader here reads it\n",
          then={"tavisk -getkernelbootarchitecturesetting": "kernel architecture is set to: x86_64\n",
                f"tr -d '\\n\\t' <{FILE} | grep -o '<dict>.*</dict>'":
                f"<dict>{OTHERS}<key>Kernel Architecture</key><string>x86_64</string></dict>\n"}),
]

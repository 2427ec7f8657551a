# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

import reports
from check import Check

SUDO = frozenset({"container", "sudo"})
RULES = ("install -m 0440 /usr/share/doc/tavisk/examples/sudoers /etc/sudoers.d/example; "
         "echo '%admin ALL = (root) NOPASSWD: TAVISK' >/etc/sudoers.d/test; ")


def by_alice(script):
    return f"cat >/run/script <<'END'\n{script}\nEND\nsetpriv --reuid alice --regid alice --init-groups sh /run/script"


CHECKS = [
    Check("the installed program starts", do="tavisk -getdate", prints=re.compile(r"Date: \d+/\d+/\d{4}\n"),
          then={'readlink -f "$(command -v tavisk)"': "/usr/bin/tavisk\n"}),
    Check("the program is where users find it, and where it was", needs=frozenset({"container"}),
          do=by_alice("PATH=/usr/local/bin:/usr/bin:/bin:/usr/games; readlink -f $(command -v tavisk)"),
          prints="/usr/bin/tavisk\n", then={"readlink -f /usr/sbin/tavisk": "/usr/bin/tavisk\n"}),
    Check("the package's own test passes", do="/root/smoke-test", prints="the installed tavisk works\n",
          needs=frozenset({"bus"})),
    Check("without rules for sudo the manual's recipe says nothing", needs=SUDO,
          do="rm -f /etc/sudoers.d/example; " + by_alice(reports.recipe())),
    Check("the example of rules for sudo is well-formed", needs=SUDO, do=RULES + "visudo -c -q -f /etc/sudoers.d/example"),
    Check("with them the recipe tells what was done", needs=SUDO,
          do=by_alice(reports.recipe("-settimezone Asia/Tokyo -settimezone Europe/Paris")), prints="done\n",
          then={"readlink -f /etc/localtime": "/usr/share/zoneinfo/Europe/Paris\n"}),
    Check("and what was not", needs=SUDO, do=by_alice(reports.recipe("-settimezone Europe/Pari") + "\n" +
                                                     reports.recipe("-setwakeonmodem on"))),
    Check("they let nobody write a file as root", needs=SUDO,
          do=by_alice("for to in /run/made fd:4 fd:1; do TAVISK_REPORT=$to sudo tavisk -getdate 4>&1; done"),
          prints=re.compile(r"(Date: [\d/]+\n){3}"), then={"ls -d /run/made 2>/dev/null": ""}),
]

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

NEEDS = frozenset({"bus", "container", "jq", "openssh-server"})
COMPUTER = 'say "w" \\ $HOME \u00fc'
FOUND = "taviskctl status --json timezone computername localsubnetname >/run/found.json\n"
WANTED = """cat >/run/wanted.json <<'END'
{ "Local Subnet Name": "applied.example.org", // its first part is in force
  "Computer Name": "say \\"w\\" \\\\ $HOME \u00fc", "Computer Sleep": "45 minutes", "Time Zone": "Asia/Kathmandu", "Remote Login": true }
END
"""
APPLY = "taviskctl apply --json {} >/run/told; status=$?; "
OUTCOMES = """jq -r '.done, .changed, (.settings[] | .setting + ": " + .outcome)' /run/told; """
END = "exit $status"
AS_WANTED = {
    "readlink /etc/localtime | sed 's,.*zoneinfo/,,'": "Asia/Kathmandu\n",
    "hostnamectl hostname --pretty": COMPUTER + "\n",
    "cat /etc/hostname; uname -n": "applied.example.org\n" * 2,
    "systemctl is-active ssh.service": "active\n",
}

CHECKS = [
    Check("a file of settings is applied in the order that works", needs=NEEDS, then=AS_WANTED,
          do=FOUND + WANTED + APPLY.format("--skip-unsupported --from /run/wanted.json") + OUTCOMES + END,
          prints=re.compile("true\ntrue\nTime Zone: applied\nComputer Sleep: not supported\nComputer Name: applied\n"
                            "Local Subnet Name: applied\nRemote Login: (applied|unchanged)\n")),
    Check("a second run changes nothing", needs=NEEDS, then=AS_WANTED,
          do="touch /run/mark; " + APPLY.format("--skip-unsupported --from /run/wanted.json") + OUTCOMES +
             "find /etc -newer /run/mark; " + END,
          prints="true\nfalse\nTime Zone: unchanged\nComputer Sleep: not supported\nComputer Name: unchanged\n"
                 "Local Subnet Name: unchanged\nRemote Login: unchanged\n"),
    Check("nobody is locked out", needs=NEEDS, do="taviskctl apply -settimezone Etc/UTC setremotelogin OFF", status=1,
          errors=re.compile("taviskctl: Remote Login is not turned off .*\n"), then=AS_WANTED),
    Check("who is nobody may not", needs=NEEDS, status=1,
          do="setpriv --reuid nobody --regid nogroup --clear-groups taviskctl apply -settimezone Etc/UTC",
          errors="taviskctl: run words of tavisk: not an administrator\n", then=AS_WANTED),
    Check("what this machine cannot have or take is told", needs=NEEDS, status=1, then=AS_WANTED,
          do=APPLY.format("-setcomputersleep 10 -settimezone Europe/Nowhere") + OUTCOMES + END,
          prints="false\nfalse\nComputer Sleep: not supported\nTime Zone: refused\n"),
    Check("what status told is applied again", needs=NEEDS,
          do="taviskctl apply --from /run/found.json >/dev/null; " + APPLY.format("--from /run/found.json") +
             "jq -c '[.done, .changed]' /run/told; " + END, prints="[true,false]\n"),
]

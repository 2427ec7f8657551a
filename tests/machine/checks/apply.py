# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

NEEDS = frozenset({"bus", "jq", "openssh-server"})
COMPUTER = 'say "w" \\ $HOME \u00fc'
WANTED = """cat >/run/wanted.json <<'END'
{ "Local Subnet Name": "applied.example.org", // its first part is in force
  "Computer Name": "say \\"w\\" \\\\ $HOME \u00fc", "Computer Sleep": "45 minutes", "Time Zone": "Asia/Kathmandu", "Remote Login": true }
END
taviskctl status --json timezone computername computersleep >/run/found.json
"""
APPLY = "taviskctl apply --from /run/wanted.json"
# The outcome of each setting.
OUTCOMES = " | awk 'NR > 1 && !/^ / { print $1, $2, $NF }'"
AS_WANTED = {
    "readlink /etc/localtime | sed 's,.*zoneinfo/,,'": "Asia/Kathmandu\n",
    "hostnamectl hostname --pretty": COMPUTER + "\n",
    "cat /etc/hostname; uname -n": "applied.example.org\n" * 2,
    "busctl get-property org.freedesktop.login1 /org/freedesktop/login1 org.freedesktop.login1.Manager IdleActionUSec":
        f"t {45 * 60_000_000}\n",
    "systemctl is-active ssh.service": "active\n",
}

CHECKS = [
    Check("a file of settings is applied in the order that works", needs=NEEDS, do=WANTED + APPLY + OUTCOMES,
          prints=re.compile("Time Zone applied\nComputer Sleep applied\nComputer Name applied\nLocal Subnet applied\n"
                            "Remote Login (applied|unchanged)\n"), then=AS_WANTED),
    Check("a second run changes nothing", needs=NEEDS,
          do=f"touch /run/mark; {APPLY} --json | jq -c '[.done, .changed]'; find /etc -newer /run/mark",
          prints="[true,false]\n", then=AS_WANTED),
    Check("nobody is locked out", needs=NEEDS, do="taviskctl apply -settimezone Etc/UTC setremotelogin OFF", status=1,
          errors=re.compile("taviskctl: Remote Login is not turned off .*\n"), then=AS_WANTED),
    Check("who is nobody may not", needs=NEEDS, status=1,
          do="setpriv --reuid nobody --regid nogroup --clear-groups taviskctl apply -settimezone Etc/UTC",
          errors="taviskctl: run words of tavisk: not an administrator\n", then=AS_WANTED),
    Check("what does not fit the machine is told", needs=NEEDS, status=1,
          do="taviskctl apply -setwakeonmodem on -settimezone Europe/Nowhere" + OUTCOMES + "; exit 1",
          prints=re.compile(".*refused.*", re.DOTALL), then=AS_WANTED),
    Check("what status told is applied again", needs=NEEDS, do="taviskctl apply --from /run/found.json >/dev/null; "
          "taviskctl apply --from /run/found.json --json | jq -c '[.done, .changed]'", prints="[true,false]\n"),
]

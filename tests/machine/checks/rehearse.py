# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What is rehearsed is what the machine then does."""

import pathlib
import re

from check import Check

CONTAINER = frozenset({"container"})
SERVER = frozenset({"rehearsal"})
DISKS = frozenset({"startup"})
GETTERS = ("-gettimezone -listtimezones -getusingnetworktime -getnetworktimeserver -getsleep -getcomputersleep -getdisplaysleep "
           "-getharddisksleep -getwakeonmodem -getwakeonnetworkaccess -getrestartpowerfailure -getrestartfreeze "
           "-getallowpowerbuttontosleepcomputer -getwaitforstartupafterpowerfailure -getremotelogin -getremotevelmarevents "
           "-getcomputername -getlocalsubnetname -getkernelbootarchitecturesetting "
           "-getdisablekeyboardwhenenclosurelockisengaged -liststartupdisks -getstartupdisk")
# Every getter by itself, as one that fails says so in the status.
SAME_ANSWERS = f"""rm -rf /run/copy
taviskctl rehearse --keep /run/copy -getdate >/run/rehearsed || cat /run/rehearsed
for getter in {GETTERS}; do
  tavisk $getter >/run/machine 2>&1; machine=$?
  TAVISK_HOST=scratch:/run/copy tavisk $getter >/run/copied 2>&1; copied=$?
  cmp -s /run/machine /run/copied && [ $machine = $copied ] && continue
  echo "$getter: $machine, $copied"; diff /run/machine /run/copied
done
stat -c %a /run/copy; ls -d /tmp/taviskctl-* 2>/dev/null
rm -rf /run/copy
"""

KEYBOARD = "disablekeyboardwhenenclosurelockisengaged"
# Words of one run, a line each, quoted as in a shell.
SETS = pathlib.Path(__file__).with_name("rehearsed.words").read_text(encoding="utf-8").splitlines()
CHOICES = ("-setstartupdisk Backup -getstartupdisk", "-setstartupdisk Stick -liststartupdisks -setstartupdisk Stick",
           "-setstartupdisk Archive -getstartupdisk", "-setstartupdisk Backup")
AT_ONCE = {CONTAINER: 19, SERVER: 6}  # a check has its time
# Texts, flags and outcomes in their order; then the status.
COMPARE = """told() { grep -o -e '"failed":[a-z]*' -e '{"setting":"[^"]*","outcome":"[^"]*"' -e '"output":"[^"]*"' "$1"; }
while IFS= read -r words; do
  # A client that the last one restarts goes on with that.
  timeout 5 sh -c 'while systemctl list-jobs --no-legend | grep -q .; do sleep 0.05; done'
  eval "taviskctl rehearse --json $words" >/run/foretold 2>&1 </dev/null
  rm -f /run/report; systemctl reset-failed  # no daemon is started too often
  eval "TAVISK_REPORT=/run/report tavisk -f $words" >/dev/null 2>&1 </dev/null; status=$?
  sed -i 's/,"settings":\\[.*//' /run/foretold
  told /run/foretold >/run/there; told /run/report >/run/here
  case $(grep failed /run/there | tail -n 1) in *true) foretold=1 ;; *) foretold=0 ;; esac
  cmp -s /run/there /run/here && [ $status = $foretold ] && continue
  echo "$words: $foretold, $status"; diff /run/there /run/here; cat /run/foretold
done <<'END'
"""

# A unit that is masked, a server that is forbidden, a file that says otherwise.
IN_THE_WAY = [
    ("systemctl disable --quiet --now ssh.socket ssh.service; systemctl mask --quiet ssh.service",
     "-setremotelogin on -getremotelogin", "systemctl unmask --quiet ssh.service"),
    ("systemctl disable --quiet --now ssh.service; touch /etc/ssh/sshd_not_to_be_run", "-setremotelogin on -getremotelogin",
     "rm /etc/ssh/sshd_not_to_be_run"),
]


# What earlier checks want kept, as words that bring it back.
REMEMBER = """touch /etc/hosts; cp -p /etc/hosts /run/hosts; rm -f /run/again
for word in timezone networktimeserver localsubnetname computername usingnetworktime remotelogin KEYBOARD; do
  echo "tavisk -f -set$word '$(tavisk -get$word | sed 's/^[^:]*: //')'" >>/run/again
done
echo "tavisk -setkernelbootarchitecture $(tavisk -getkernelbootarchitecturesetting | sed 's/.* //')" >>/run/again
""".replace("KEYBOARD", KEYBOARD)
BRING_BACK = "systemctl reset-failed; sh /run/again >/run/printed 2>&1; cp -p /run/hosts /etc/hosts\n"


def compared(lines):
    """Everything is then as it was before."""
    return REMEMBER + COMPARE + lines + "\nEND\n" + BRING_BACK


CHECKS = [
    Check("the copy answers what the machine answers", needs=needs, do=SAME_ANSWERS, prints="700\n")
    for needs in (CONTAINER, SERVER, DISKS)
] + [
    Check("a rehearsal changes nothing of the machine", needs=CONTAINER,
          do="applied() { journalctl --sync; journalctl -b -t tavisk -o cat | grep -c applied; }; before=$(applied); touch /run/mark; "
             "sleep 0.1; taviskctl rehearse -settimezone Asia/Tokyo -setcomputername X -setremotelogin off "
             "-setlocalsubnetname y -setnetworktimeserver z.example -setkernelbootarchitecture i386 >/run/rehearsed; "
             "find /etc /var/lib/tavisk /Library -newer /run/mark 2>/dev/null; [ $before = $(applied) ] && echo as before; "
             "grep -c -e Asia/Tokyo -e ' X ' /run/rehearsed", prints="as before\n2\n"),
] + [
    Check(f"sets {start + 1} and more of {len(SETS)} end as it was rehearsed", needs=needs,
          do=compared("\n".join(SETS[start:start + at_once])))
    for needs, at_once in AT_ONCE.items() for start in range(0, len(SETS), at_once)
] + [
    Check("a startup disk is chosen as it was rehearsed", needs=DISKS, do=COMPARE + "\n".join(CHOICES) + "\nEND\n"),
] + [
    Check(f"what stands in the way is foretold: {first}", needs=CONTAINER | {"openssh-server"},
          do=f"{first}\n{compared(words)}{last}") for first, words, last in IN_THE_WAY
]

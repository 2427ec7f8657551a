# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What is rehearsed is what the machine then does."""

import re

from check import Check

CONTAINER = frozenset({"container"})
GETTERS = ("-gettimezone -listtimezones -getusingnetworktime -getnetworktimeserver -getsleep -getcomputersleep -getdisplaysleep "
           "-getharddisksleep -getwakeonmodem -getwakeonnetworkaccess -getrestartpowerfailure -getrestartfreeze "
           "-getallowpowerbuttontosleepcomputer -getwaitforstartupafterpowerfailure -getremotelogin -getremotevelmarevents "
           "-getcomputername -getlocalsubnetname -getkernelbootarchitecturesetting "
           "-getdisablekeyboardwhenenclosurelockisengaged")
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
LONG_NAME = ".".join(["a" * 40] * 2)
SETS = f"""
-settimezone Europe/Paris
-settimezone Europe/Paris -gettimezone
-settimezone Nowhere/Land
-settimezone europe/rome -gettimezone
-settimezone ''
-settimezone ../../etc/passwd
-settimezone Asia/Tokyo -gettimezone -settimezone Asia/Tokyo -settimezone Europe/Rome -gettimezone
-setdate 1/1/1950
-setdate 13/1/2030
-setdate ''
-setdate 1/2/2031 -settime 3:4:5
-settime 25:0:0
-settime noon
-setusingnetworktime off -settime 1:2:3
-setusingnetworktime off
-setusingnetworktime on -getusingnetworktime -settime 1:2:3
-setusingnetworktime on -setusingnetworktime off -getusingnetworktime -setusingnetworktime off
-setusingnetworktime maybe
-setusingnetworktime ''
-setnetworktimeserver time.example -getnetworktimeserver
-setnetworktimeserver time.example
-setnetworktimeserver 'two words'
-setnetworktimeserver ''
-setnetworktimeserver a.example -setnetworktimeserver b.example -getnetworktimeserver
-setsleep 20 -getsleep
-setsleep never
-setsleep 181
-setcomputersleep 30
-setcomputersleep soon
-setdisplaysleep 10 -getdisplaysleep
-setharddisksleep -5
-setharddisksleep ''
-setwakeonmodem on
-setwakeonmodem off
-setwakeonnetworkaccess on
-setwakeonnetworkaccess maybe
-setrestartpowerfailure on
-setrestartpowerfailure off
-setrestartfreeze on -getrestartfreeze
-setrestartfreeze off
-setrestartfreeze maybe
-setallowpowerbuttontosleepcomputer on
-setallowpowerbuttontosleepcomputer off
-setwaitforstartupafterpowerfailure 30
-setwaitforstartupafterpowerfailure 999990
-setwaitforstartupafterpowerfailure soon
-setremotelogin on -getremotelogin
-setremotelogin on
-setremotelogin off -getremotelogin -setremotelogin off
-setremotelogin maybe
-setremotelogin on -setremotelogin off -setremotelogin on -getremotelogin
-setremotevelmarevents on -getremotevelmarevents
-setremotevelmarevents off
-setremotevelmarevents maybe
-setcomputername 'A machine' -getcomputername
-setcomputername 'A machine'
-setcomputername 'Z\u00fcrich, "2" of $HOME' -getcomputername
-setcomputername "$(printf 'a\\001b')" -getcomputername
-setcomputername '' -getcomputername -setlocalsubnetname mail.example -getlocalsubnetname -getcomputername
-setlocalsubnetname host-a -getlocalsubnetname
-setlocalsubnetname host-a
-setlocalsubnetname host-a.example -getlocalsubnetname -setcomputername Front -getcomputername
-setlocalsubnetname 'bad name'
-setlocalsubnetname {LONG_NAME}
-setkernelbootarchitecture i386 -getkernelbootarchitecturesetting
-setkernelbootarchitecture default -getkernelbootarchitecturesetting -setkernelbootarchitecture x86_64
-setkernelbootarchitecture ppc
-set{KEYBOARD} yes -get{KEYBOARD}
-set{KEYBOARD} yes -set{KEYBOARD} no -get{KEYBOARD}
-set{KEYBOARD} maybe
-liststartupdisks -getstartupdisk
-setstartupdisk Nowhere -getstartupdisk -setstartupdisk ''
nonsense -settimezone Europe/Rome
""".strip().splitlines()
AT_ONCE = 19  # a check has its time
# Texts, flags and outcomes in their order; then the status.
COMPARE = """told() { grep -o -e '"failed":[a-z]*' -e '{"setting":"[^"]*","outcome":"[^"]*"' -e '"output":"[^"]*"' "$1"; }
while IFS= read -r words; do
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
    Check("the copy answers what the machine answers", needs=CONTAINER, do=SAME_ANSWERS, prints="700\n"),
    Check("a rehearsal changes nothing of the machine", needs=CONTAINER,
          do="applied() { journalctl --sync; journalctl -b -t tavisk -o cat | grep -c applied; }; before=$(applied); touch /run/mark; "
             "sleep 0.1; taviskctl rehearse -settimezone Asia/Tokyo -setcomputername X -setremotelogin off -setlocalsubnetname y "
             "-setnetworktimeserver z.example -setkernelbootarchitecture i386 >/run/rehearsed; "
             "find /etc /var/lib/tavisk /Library -newer /run/mark 2>/dev/null; [ $before = $(applied) ] && echo as before; "
             "grep -c -e Asia/Tokyo -e ' X ' /run/rehearsed", prints="as before\n2\n"),
] + [
    Check(f"sets {start + 1} and more of {len(SETS)} end as it was rehearsed", needs=CONTAINER,
          do=compared("\n".join(SETS[start:start + AT_ONCE]))) for start in range(0, len(SETS), AT_ONCE)
] + [
    Check(f"what stands in the way is foretold: {first}", needs=CONTAINER | {"openssh-server"},
          do=f"{first}\n{compared(words)}{last}") for first, words, last in IN_THE_WAY
]

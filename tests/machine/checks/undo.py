# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
import re

from check import Check

# On a machine whose clock other checks set, "since" is not what it seems.
NEEDS = frozenset({"bus", "container"})
READY = "journalctl --sync; "
TABLE = r"Setting +Was +Back to +Outcome\n"
HOSTILE = r""" -a "b" \n\x41 'c' $(id) \u{202E}é\u{1F600}  """


def by(user, command):
    return f"setpriv --reuid {user} --regid {user} --init-groups {command}; "


def entry_by(user, *fields):
    """An entry in tavisk's name, with what the journal does not take from anybody."""
    lines = " ".join(f"'{field}'" for field in ("MESSAGE=x", "SYSLOG_IDENTIFIER=tavisk", "_UID=0", "TAVISK_UID=0",
                                                "TAVISK_SETTING=Time Zone", *fields))
    return f"printf '%s\\n' {lines} | " + by(user, "logger --journald")


# What would take the zone to Tokyo.
TOKYO = ("TAVISK_OUTCOME=applied", "TAVISK_CHANGED=yes", "TAVISK_OLD=Asia/Tokyo", "TAVISK_NEW=Europe/Paris", "TAVISK_RUN=z")
LINE = "echo 'Time Zone: applied, was \"Asia/Tokyo\"' | " + by("mallory", "systemd-cat -t tavisk")


def quoted(text):
    return "'" + text.replace("'", "'\\''") + "'"


STATE = "tavisk -gettimezone -getcomputername"
ZONE = "readlink -f /etc/localtime"

CHECKS = [
    Check("what the last run has changed is taken back", needs=NEEDS,
          do=f"sleep 1; date +%s >/run/undo-since; {STATE} >/run/undo-before; tavisk -settimezone Asia/Dubai "
             "-setcomputername A >/dev/null; tavisk -settimezone Europe/Paris -setcomputername B -settimezone Asia/Tokyo "
             ">/dev/null; tavisk -gettimezone -settimezone Asia/Tokyo >/dev/null; " + READY + "taviskctl undo --run",
          prints=re.compile(TABLE + r"Time Zone +Asia/Tokyo +Asia/Dubai +applied\nComputer Name +B +A +applied\n"),
          then={ZONE: "/usr/share/zoneinfo/Asia/Dubai\n", "hostnamectl hostname --pretty": "A\n"}),
    Check("an undo is one itself", needs=NEEDS, do=READY + "taviskctl undo --run",
          prints=re.compile(TABLE + r"Time Zone +Asia/Dubai +Asia/Tokyo +applied\nComputer Name +A +B +applied\n"),
          then={ZONE: "/usr/share/zoneinfo/Asia/Tokyo\n"}),
    Check("what others have written in tavisk's name does not count", needs=NEEDS,
          do="tavisk -settimezone Europe/Paris >/dev/null; " + entry_by("mallory", *TOKYO) + LINE + READY + "taviskctl undo",
          prints=re.compile(r"Setting +Now +Back to\nTime Zone +Europe/Paris +Asia/Tokyo\n"),
          errors=re.compile(r"(.*\n)?taviskctl: left out are changes in tavisk's name by users who are no administrators: \d+\n"),
          then={"journalctl -q _UID=$(id -u mallory) -o export TAVISK_RUN=z | grep '^TAVISK_CHANGED=yes' | uniq": "TAVISK_CHANGED=yes\n"}),
    Check("what an administrator has written counts", needs=NEEDS,
          do=entry_by("alice", *TOKYO[:2], "TAVISK_OLD=Asia/Kolkata", "TAVISK_NEW=Europe/Paris") + READY + "taviskctl undo",
          prints=re.compile(r"Setting +Now +Back to\nTime Zone +Europe/Paris +Asia/Kolkata\n")),
    Check("any name comes back as it was", needs=NEEDS,
          do=f"tavisk -setcomputername {quoted(HOSTILE)} >/dev/null; tavisk -getcomputername >/run/name; "
             "tavisk -setcomputername plain >/dev/null; " + READY +
             "taviskctl undo --run >/dev/null; echo $?; tavisk -getcomputername | cmp - /run/name && echo same",
          prints="0\nsame\n"),
    Check("a name that there was not is taken away, and comes back", needs=NEEDS,
          do="tavisk -setcomputername '' >/dev/null; tavisk -setcomputername plain >/dev/null; " + READY +
             "taviskctl undo --run; grep -s PRETTY_HOSTNAME=. /etc/machine-info || echo none; " + READY + "taviskctl undo --run",
          prints=re.compile(TABLE + r"Computer Name +plain +- +applied\nnone\n" + TABLE + r"Computer Name +- +plain +applied\n"),
          then={"hostnamectl hostname --pretty": "plain\n"}),
    Check("what somebody else has changed is left alone", needs=NEEDS,
          do="tavisk -settimezone UTC -setcomputername A >/dev/null; timedatectl set-timezone Asia/Kolkata; " + READY +
             "taviskctl undo --run", status=1,
          prints=re.compile(TABLE + r"Time Zone +Asia/Kolkata +Europe/Paris +left alone\n  tavisk had left it at \"UTC\".*\n"
                            r"Computer Name +A +plain +applied\n"),
          then={ZONE: "/usr/share/zoneinfo/Asia/Kolkata\n"}),
    Check("by force it is not", needs=NEEDS,
          do="tavisk -settimezone UTC >/dev/null; timedatectl set-timezone Asia/Tokyo; " + READY + "taviskctl undo --run --force",
          prints=re.compile(TABLE + r"Time Zone +Asia/Tokyo +Asia/Kolkata +applied\n")),
    Check("all since a time is taken back", needs=NEEDS,
          do="sleep 1; from=$(date +%s); tavisk -settimezone UTC >/dev/null; tavisk -settimezone Asia/Tokyo >/dev/null; " +
             READY + 'taviskctl undo --since "@$from" --run',
          prints=re.compile(TABLE + r"Time Zone +Asia/Tokyo +Asia/Kolkata +applied\n")),
    Check("a change that was killed is told", needs=NEEDS,
          do="tavisk -settimezone UTC >/dev/null; " + entry_by("root", "TAVISK_OUTCOME=begins", "TAVISK_ASKED=Asia/Tokyo") +
             READY + "taviskctl undo",
          status=1, prints=re.compile(r"Setting .*\nTime Zone +UTC +-\n  not possible: a run that was ended in the middle .*\n")),
    Check("who may not read the journal is told so", needs=NEEDS, status=1,
          do=by("alice", "taviskctl undo"),
          errors=re.compile(r"taviskctl: .*/log/journal/.*: Permission denied\n")),
    Check("who has no journal is told so", needs=NEEDS, status=1,
          do="unshare --mount sh -c 'mount -t tmpfs none /var/log; mount -t tmpfs none /run/log; taviskctl undo'",
          errors="taviskctl: read on this machine's journal: there is none\n"),
    Check("all of this is taken back", needs=NEEDS, prints="0\nsame\n",
          do=READY + 'taviskctl undo --since "@$(cat /run/undo-since)" --run >/dev/null; echo $?; '
             f"{STATE} | cmp - /run/undo-before && echo same"),
]

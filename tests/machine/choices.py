# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""What is checked where one system chooses another, with the firmware's and the loader's own tools as witnesses."""

import re

from check import Check

CORE = "/System/Library/CoreServices"
PROGRAM = "sh /usr/lib/in-time.sh tavisk"
LIST = f"{PROGRAM} -liststartupdisks | sort"
GET = f"{PROGRAM} -getstartupdisk"
ENTRIES = "efibootmgr | grep ^Boot0 | sort | diff /run/entries -"  # prints what was made or lost
# The line of the entry that comes first, with the nodes of partitions in place of their identifiers.
FIRST = """line=$(efibootmgr -v | grep "^Boot$(efibootmgr | sed -n 's/BootOrder: //p' | cut -d, -f1)")
for node in /dev/vd[a-c]1; do
  line=$(echo "$line" | sed "s!HD(1,GPT,$(lsblk -no PARTUUID $node),[^)]*)!$node!")
done
echo "$line" | cut -f 2"""
# The mounts that anybody sees while the command runs.
WATCHED = """touch /run/watching
while [ -e /run/watching ]; do cut -d ' ' -f 3,5 /proc/self/mountinfo; sleep 0.1; done >/run/seen & watch=$!
{command}
rm /run/watching; wait $watch
cut -d ' ' -f 3,5 /proc/self/mountinfo | sort -u >/run/mounts; sort -u /run/seen | comm -23 - /run/mounts"""


def of(running, other, then, unlisted=(), mount=""):
    """What holds on the one that runs before it chooses the other, and afterwards."""
    listed = f"{CORE}\n/Volumes/{other}{CORE}\n"
    missing = "".join(f"/Volumes/{name}{CORE}" for name in unlisted)
    return [
        Check("lists exactly the systems that can be started, and mounts nothing where anybody sees it",
              do=WATCHED.format(command=LIST), prints=listed,
              then={f"{LIST} | grep -F '{missing or 'nothing'}'": "", f"findmnt -no TARGET -S LABEL={other}": ""}),
        Check("lists the same when the other is mounted", do=f"mount LABEL={other} /mnt && {LIST}", prints=listed,
              then={"umount /mnt && findmnt /mnt": ""}),
        Check("tells that the running system is the one that starts next", do=GET, prints=f"{CORE}\n"),
        Check(f"chooses {other}",
              do=f"efibootmgr 2>/dev/null | grep ^Boot0 | sort >/run/entries; {mount}{PROGRAM} -setstartupdisk {other}",
              prints=f"Set Startup Disk to Path: /Volumes/{other}{CORE}\n",
              then={GET: f"/Volumes/{other}{CORE}\n", **then, LIST: listed}),
    ]


def entry(partition, file):
    return re.compile(re.escape(f"{partition}/File({file})") + ".*\n")

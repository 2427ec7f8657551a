# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""The startup disk, with the firmware's own tool as the witness."""

import re

from check import Check

NEEDS = frozenset({"startup"})
CONTAINER = frozenset({"container"})
CORE = "/System/Library/CoreServices"
VOLUMES = ("Archive", "Backup", "Disc", "Projects", "Stick")
VARIABLES = "/sys/firmware/efi/efivars"
LANGUAGE = f"{VARIABLES}/prev-lang:kbd-*"
# A system on the root volume too, and one on an image, which is none to start from.
LIST = f"""install_system() {{ mkdir -p "$1{CORE}" && touch "$1{CORE}/boot.efi" "$1/mach_kernel"; }}
install_system ""
truncate -s 16M /run/image
mkfs.ext4 -q /run/image
mkdir -p /Volumes/Image
mount -o loop /run/image /Volumes/Image
install_system /Volumes/Image
tavisk -liststartupdisks | sort
umount /Volumes/Image
rm -r /System /mach_kernel /run/image"""
GET = "tavisk -getstartupdisk"
ORDER = "efibootmgr | sed -n s/BootOrder:.//p"
REPORT = "rm -f /run/report; TAVISK_REPORT=/run/report "
# The line of the entry that comes first.
FIRST = f"number=$({ORDER} | cut -d, -f1); efibootmgr -v | grep ^Boot$number"


def chosen(volume):
    return f"Set Startup Disk to Path: /Volumes/{volume}{CORE}\n"


def first(label, path):
    return re.compile(rf"Boot[0-9A-F]{{4}}\* tavisk {label}\t{re.escape(path)}\n")


def refused(volume, command, reason):
    return Check(f"refuses {volume}: {reason}", do=command, status=1,
                 prints=f"Can't set startup disk to /Volumes/{volume}{CORE}\n",
                 errors=re.compile(f".*{reason}.*", re.DOTALL), needs=NEEDS,
                 then={f"cmp /run/variables-before /run/variables-after && {GET}": f"/Volumes/Stick{CORE}\n"})


def watched(command):
    """The command, with what all variables were before and after it."""
    look = f"(cd {VARIABLES} && sha256sum $(ls | grep -v ^MTC-))"
    return (f"{look} >/run/variables-before; TAVISK_LOG=stderr {command}; status=$?; "
            f"mount -o remount,rw {VARIABLES}; {look} >/run/variables-after; exit $status")


CHECKS = [
    Check("a machine without UEFI variables says that it cannot have the setting, and not that a read failed",
          do=f"{REPORT}TAVISK_LOG=stderr tavisk -getstartupdisk; grep -o '\"setting\":\"[A-Za-z ]*\",\"supported\":false' /run/report | "
             "sort; grep -c '\"effects\":\\[\\]' /run/report",
          prints='"setting":"Network Startup Disk","supported":false\n"setting":"Startup Disk","supported":false\n1\n',
          errors="", needs=CONTAINER,
          then={"ls /var/lib/tavisk/previous-boot-order 2>&1 | grep -c 'No such'": "1\n"}),
    Check("lists exactly the startable volumes", do=LIST, needs=NEEDS,
          prints=f"{CORE}\n" + "".join(f"/Volumes/{volume}{CORE}\n" for volume in VOLUMES)),
    Check("sets a volume that firmware cannot read, by its file beside", do="tavisk -setstartupdisk Projects",
          prints=chosen("Projects"), needs=NEEDS,
          then={GET: f"/Volumes/Projects{CORE}\n",
                FIRST: re.compile(r"Boot.*tavisk Projects\tHD\(1,GPT,.*\\EFI\\tavisk\\0f1e2d3c-.*\\boot\.efi\)\n")}),
    Check("sets a volume of a USB disk, and names each place that was written, and its own entry when that was made",
          do=f"{ORDER} >/run/order; ls {VARIABLES} >/run/names; {REPORT}tavisk -setstartupdisk Stick; "
             f"ls {VARIABLES} | comm -13 /run/names - | grep ^Boot0 | while read entry; do "
             "grep -c \"BootOrder-[^\\\"]*, [^\\\"]*$entry\\\"\" /run/report; done | sort -u; "
             "grep -o '\"where\":\"/var/lib/tavisk/previous-boot-order, [^\",]*/BootOrder' /run/report",
          prints=re.compile(re.escape(chosen("Stick")) + "(1\n)?" +
                            re.escape(f'"where":"/var/lib/tavisk/previous-boot-order, {VARIABLES}/BootOrder\n')),
          needs=NEEDS,
          then={GET: f"/Volumes/Stick{CORE}\n", "cmp /run/order /var/lib/tavisk/previous-boot-order": "",
                FIRST: re.compile(r"Boot.*tavisk STICK\tHD\(1,GPT,.*\n")}),
    refused("Archive", watched("tavisk -setstartupdisk Archive"), "does not read ext4"),
    refused("Disc", watched("tavisk -setstartupdisk Disc"), "does not read iso9660"),
    refused("Backup", watched(f"sh -c 'mount -o remount,ro {VARIABLES}; exec tavisk -setstartupdisk Backup'"),
            "Read-only file system"),
    Check("sets a volume of an MBR disk", do="tavisk -setstartupdisk Backup", prints=chosen("Backup"), kept=True,
          needs=NEEDS, then={GET: f"/Volumes/Backup{CORE}\n", FIRST: first(
              "BACKUP", r"HD(1,MBR,0x1badd00d,0x800,0x8000)/File(\System\Library\CoreServices\boot.efi)")}),
    Check("keeps language and keyboard for the firmware", do="true", needs=NEEDS,
          then={f"cat {LANGUAGE} | tail -c +5; lsattr {LANGUAGE} | cut -c5": "en:0i\n"}),
]

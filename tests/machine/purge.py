# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Removes the package from a machine on which its settings were changed."""

MADE = ("find /etc /var/lib /usr /Library -name '*tavisk*' -not -path '/var/lib/dpkg/*' -not -path '/var/lib/systemd/*' "
        "2>/dev/null; if [ -d /sys/firmware/efi/efivars ]; then "
        "grep -l t.a.v.i.s.k. /sys/firmware/efi/efivars/Boot0*; ls /sys/firmware/efi/efivars/*-216b9a59-*; fi 2>/dev/null")
EMPTY = ("find /etc/systemd /etc/chrony /etc/ntpsec /etc/tmpfiles.d /etc/udev /etc/sysctl.d /Library -type d -empty 2>/dev/null | "
         "while read -r folder; do dpkg-query -S \"$folder\" >/dev/null 2>&1 || echo \"$folder\"; done")
IN_FORCE = "readlink /etc/localtime; cat /etc/hostname /etc/machine-info 2>/dev/null; getent group admin"


def prove(machine, results):
    """Last of all: the machine is without the program afterwards."""
    empty = machine.run(EMPTY).output.splitlines()
    made = machine.run(MADE).output.splitlines()
    in_force = machine.run(IN_FORCE).output
    problems = [] if any(path.startswith("/etc/") for path in made) else ["nothing was made that could be left behind"]
    # The collection's package too, where it is installed.
    purged = machine.run("dpkg --purge $(dpkg-query --show '*tavisk*' | cut -f 1)")
    if purged.status:
        problems.append(purged.output + purged.errors)
    problems += ["left: " + path for path in machine.run(MADE).output.splitlines()]
    problems += ["empty: " + path for path in machine.run(EMPTY).output.splitlines() if path not in empty]
    if machine.run(IN_FORCE).output != in_force:
        problems.append("values changed")
    results.add(f"{machine.name}: purging the package leaves nothing of its own, and the values in force", problems)

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Kills a change of the startup disk before each call that changes a file, from the first that opens a variable."""

import re

COMMAND = "tavisk -setstartupdisk Stick"
CALLS = "openat2,write,fsync,ftruncate,mkdirat,renameat,renameat2,unlinkat,ioctl"
WITHOUT_ORDER = "cd /sys/firmware/efi/efivars && sha256sum $(ls | grep -v -e '^BootOrder-' -e '^{entry}-' -e '^MTC-')"


def _kill_points(trace):
    """(name, which call of that name) of each call that counts."""
    counts, points, begun = {}, [], False
    for name, words in re.findall(r"^(?:\d+ +)?(\w+)\((.*)", trace, re.MULTILINE):
        counts[name] = counts.get(name, 0) + 1
        changes = name != "openat2" or re.search("O_WRONLY|O_RDWR|O_CREAT", words)
        begun = begun or (name == "openat2" and "efivars" in words and changes)
        if begun and changes:
            points.append((name, counts[name]))
    return points


def _order(machine):
    return re.search(r"BootOrder: (.*)", machine.run("efibootmgr").output).group(1)


def _entry_of(machine, label):
    found = re.search(rf"Boot([0-9A-F]{{4}})\* tavisk {label}", machine.run("efibootmgr").output)
    return found and found.group(1)


def _restore(machine, order):
    if number := _entry_of(machine, "STICK"):
        machine.run(f"efibootmgr -q -b {number} -B")
    machine.run(f"efibootmgr -q -o {order}")


def faults(machine):
    """What was wrong after a kill; nothing when all was well."""
    machine.run("tavisk -setstartupdisk Backup")
    _restore(machine, _order(machine))
    old = _order(machine)
    traced = machine.run(f"strace -f -o /run/trace -e trace={CALLS} {COMMAND}; cat /run/trace").output
    new, number = _order(machine), _entry_of(machine, "STICK")
    points = _kill_points(traced)
    if number is None or new == old or len(points) < 5:
        return [f"nothing to kill: {points}", traced[-1000:]]
    others = WITHOUT_ORDER.format(entry="Boot" + number)
    before = machine.run(others).output
    problems = []
    for name, count in points:
        _restore(machine, old)
        kill = f"-e inject={name}:signal=KILL:when={count}"
        killed = machine.run(f"strace -f -o /dev/null -e trace={CALLS} {kill} {COMMAND}")
        point = f"{name} {count}"
        if killed.status != 137:
            problems.append(f"{point}: not killed but {killed.status}")
        if (order := _order(machine)) not in (old, new):
            problems.append(f"{point}: the order is {order}, neither {old} nor {new}")
        if machine.run(others).output != before:
            problems.append(f"{point}: another variable was changed")
    finished = machine.run(COMMAND)
    if finished.status != 0 or _order(machine) != new:
        problems.append(f"the next run: {finished.output} {_order(machine)}")
    print(f"        killed {len(points)} times", flush=True)
    return problems

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Kills a change of what starts next before each call of its first thread that changes a file."""

import re

COMMAND = "tavisk -setstartupdisk Stick"
CALLS = "write,pwrite64,fsync,fdatasync,ftruncate,mkdirat,renameat,renameat2,unlinkat,ioctl"
STRACE = f"strace -f -e trace={CALLS}"  # with --seccomp-bpf no signal is put in
WITHOUT_ORDER = "cd /sys/firmware/efi/efivars && sha256sum $(ls | grep -v -e '^BootOrder-' -e '^{entry}-' -e '^MTC-')"


def _kill_points(trace):
    """(name, which call of that name) of each call that counts. Opening changes nothing that the call before it and the
    one after it do not show."""
    counts, points = {}, []
    calls = re.findall(r"^(\d+) +(\w+)\((.*)", trace, re.MULTILINE)
    for name, words in [(name, words) for thread, name, words in calls if thread == calls[0][0]]:
        counts[name] = counts.get(name, 0) + 1
        is_of_no_file = name == "ioctl" and "SETFLAGS" not in words or r'"\1\0\0\0\0\0\0\0", 8)' in words
        if not is_of_no_file:
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
    return kill_each(machine, COMMAND, lambda: _order(machine), lambda order: _restore(machine, order),
                     lambda: WITHOUT_ORDER.format(entry=f"Boot{_entry_of(machine, 'STICK')}"))


def kill_each(machine, command, state, restore, others, least=5):
    """The same for any command: `state()` is what it changes, `restore(state)` takes it back, `others()` is a command
    that prints what it leaves as it is. At least so many calls have to change something."""
    old = state()
    # Once before: the first run after a start makes files that later ones find.
    _run_in_time(machine, command, old, state)
    restore(old)
    _run_in_time(machine, f"{STRACE} -o /run/trace {command}", old, state)
    traced = machine.run("cat /run/trace").output
    new = state()
    points = _kill_points(traced)
    if new == old or len(points) < least:
        return [f"nothing to kill: {points}", traced[-1000:]]
    look = others()
    before = machine.run(look).output
    problems = []
    for name, count in points:
        restore(old)
        kill = f"-e inject={name}:signal=KILL:when={count}"
        killed = _run_in_time(machine, f"{STRACE} -o /dev/null {kill} {command}", old, state)
        point = f"{name} {count}"
        if killed.status != 137:
            problems.append(f"{point}: not killed but {killed.status}: {machine.run('cat /run/look').output}")
        if (left := state()) not in (old, new):
            problems.append(f"{point}: left {left}, neither {old} nor {new}")
        if machine.run(look).output != before:
            problems.append(f"{point}: something else was changed")
    finished = _run_in_time(machine, command, new, state)
    if finished.status != 0 or state() != new:
        problems.append(f"the next run: {finished.output} {state()}")
    print(f"        killed {len(points)} times", flush=True)
    return problems


def _run_in_time(machine, command, before, state):
    """The last answer: a refusal that changed nothing is asked again, where the look at volumes was too slow."""
    for _ in range(12):
        answer = machine.run(f"rm -f /run/look; TAVISK_REPORT=/run/look {command}")
        if answer.status != 1 or state() != before or machine.run("grep -q 'not done in time' /run/look").status:
            break
    return answer

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Proves the installed program on the machines that are named, or on all of them; see script/test-machine."""

import argparse
import subprocess
import sys
import time

import bench
import check
import container
import faults
import fleet
import guard
import guest
import machine
import powercuts
import purge
import server
import startup
import systems
import trees
import upgrade

REMOTE = ["avahi-daemon", "iproute2", "jq", "openssh-server", "sudo", "systemd-resolved"]
KINDS = {
    "container": [lambda: faults.FewFaults("systemd-timesyncd", *REMOTE), lambda: container.Container("chrony"),
                  lambda: container.Container("ntpsec")],
    "guest": [guest.Guest],
    "server": [lambda: server.Server(packages=["ansible-core"], own=["tavisk", trees.COLLECTION])],
    "startup": [startup.Startup],
    "rehearsal": [server.Rehearsal],
    "fleet": [fleet.Fleet],
    "systems": [systems.Grub, systems.BootEntries, systems.SavedDefault],
    "upgrade": [lambda: upgrade.Upgrade("systemd-timesyncd", *REMOTE)],
    "sweep": [faults.Faults],
    "powercuts": [powercuts.PowerCuts],
    "bench": [lambda: bench.Bench(*REMOTE)],
}
# take long, and are run only when they are asked for
ALONE = ("rehearsal", "systems", "fleet", "upgrade", "sweep", "powercuts", "bench")


def arguments():
    parser = argparse.ArgumentParser(prog="test-machine")
    parser.add_argument("kinds", nargs="*", metavar="KIND", help=f"{', '.join(KINDS)}; without any, all but {' and '.join(ALONE)}")
    parser.add_argument("--keep", action="store_true", help="ask for commands before a machine ends")
    chosen = parser.parse_args()
    if unknown := set(chosen.kinds) - set(KINDS):
        parser.error("no such machine: " + ", ".join(sorted(unknown)))
    return chosen


def ask_for_commands(tested):
    print("commands, one a line, until the end of input")
    for command in sys.stdin:
        answer = tested.run(command)
        print(answer.output + answer.errors, end="", flush=True)


def prove(make, results, keep):
    tested = make()
    print(f"{tested.name} (cannot {tested.cannot})", flush=True)
    began = time.monotonic()
    try:
        tested.start()
        tested.prove(results)
        if "bus" in tested.has:
            purge.prove(tested, results)
        if keep:
            ask_for_commands(tested)
    finally:
        tested.stop()
    print(f"{tested.name}: {time.monotonic() - began:.0f} s", flush=True)


def main():
    chosen = arguments()
    guard.refuse_unless_isolated()
    trees.prepare_work()
    results = check.Results()
    for kind in chosen.kinds or [kind for kind in KINDS if kind not in ALONE]:
        for make in KINDS[kind]:
            try:
                prove(make, results, chosen.keep)
            except (machine.Trouble, subprocess.SubprocessError) as trouble:
                results.add(kind, [str(trouble), getattr(trouble, "output", None) or ""])
    print(f"{results.passed} passed, {results.failed} failed")
    return 1 if results.failed else 0


sys.exit(main())

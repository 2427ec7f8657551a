# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A Debian system in a container: service manager, bus, journal and authorization are real."""

import itertools
import pathlib
import signal
import subprocess

import check
import guard
import machine
import trees

ANSWER_SECONDS = 120


class Container(machine.Machine):
    cannot = "set a clock, let a time daemon correct one, reach firmware or devices"

    def __init__(self, *packages, name="", release=trees.RELEASE, own=("tavisk",)):
        """Without a name it has that of the first package."""
        self.name = name or f"container with {packages[0]}"
        self.has = frozenset({"bus", "container", *packages})
        layer = self.name.replace(" ", "-")
        self._tree = trees.layered(layer, packages, release, own)
        self._log = trees.WORK / f"{layer}.log"
        self._manager = None
        self._first_process = None
        self._commands = itertools.count()

    def start(self):
        with open(self._log, "a") as log:
            self._manager = subprocess.Popen(
                ["systemd-nspawn", "--register=no", "--keep-unit", "--private-network", f"--machine=tavisk-{self._log.stem}",
                 "--drop-capability=CAP_SYS_TIME", "--timezone=off", "--resolv-conf=off", "--link-journal=no", "-D", self._tree, "-b"],
                stdin=subprocess.DEVNULL, stdout=log, stderr=log)
        self._first_process = machine.wait_until(self._find_first_process, 20, "the container's first process")
        guard.refuse_unless_contained(self._first_process)
        machine.wait_until(self._is_up, 60, "the container's start")

    def run(self, command):
        if check.STOP_BUS in command:  # by which it could wait in vain for the command's end
            return self.run_beside(command, ANSWER_SECONDS)
        # A name of its own: those that systemd-run makes up come again when the bus is started anew.
        unit = f"--unit=check-{next(self._commands)}"
        return self._answer(["systemd-run", "--quiet", "--pipe", "--wait", "--collect", unit, "sh", "-c", command],
                            ANSWER_SECONDS)

    def run_beside(self, command, seconds):
        """Without the service manager's help, for what renews that."""
        return self._answer(["env", "-i", "PATH=/usr/sbin:/usr/bin:/sbin:/bin", "sh", "-c", command], seconds)

    def _answer(self, words, seconds):
        try:
            result = subprocess.run(["nsenter", "--target", self._first_process, "--all", *words], stdin=subprocess.DEVNULL,
                                    capture_output=True, text=True, errors="replace", timeout=seconds)
        except subprocess.TimeoutExpired as trouble:
            raise machine.Trouble(f"no answer in {seconds} seconds to {words[-1]}") from trouble
        return check.Answer(result.returncode, result.stdout, result.stderr)

    def restart(self):
        self.stop()
        self.start()

    def stop(self):
        if self._manager is None:
            return
        self._manager.send_signal(signal.SIGTERM)
        try:
            self._manager.wait(20)
        except subprocess.TimeoutExpired:
            self._manager.kill()
            self._manager.wait()
        self._manager = None

    def _find_first_process(self):
        """The manager's child that is number 1 of a process space; for a moment there is a helper as well."""
        pid = self._manager.pid
        children = pathlib.Path(f"/proc/{pid}/task/{pid}/children").read_text().split()
        return next((child for child in children if _number_inside(child) == "1"), None)

    def _is_up(self):
        if self._manager.poll() is not None:
            raise machine.Trouble(f"the container ended: {self._log.read_text()}")
        return self.run("systemctl is-system-running --wait").output.strip() in ("running", "degraded")


def _number_inside(pid):
    try:
        status = pathlib.Path(f"/proc/{pid}/status").read_text()
    except FileNotFoundError:
        return None
    (numbers,) = (line for line in status.splitlines() if line.startswith("NSpid:"))
    return numbers.split()[-1]

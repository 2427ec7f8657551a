# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""Machines of an emulator. Commands go over their second serial port to agent.sh."""

import base64
import socket
import subprocess

import check
import machine
import trees

AGENT = trees.HOOK.with_name("agent.sh")
BOOT_SECONDS = 400
ANSWER_SECONDS = 120


class Emulated(machine.Machine):
    reboot = ""  # the command

    def __init__(self, kind, devices):
        self.name = kind
        self._folder = trees.WORK / kind
        self._folder.mkdir(exist_ok=True)
        self._devices = devices
        self._process = self._port = self._answers = None

    def start(self):
        with open(self._folder / "emulator.log", "w") as log:
            self._process = subprocess.Popen(self._arguments(), stdin=subprocess.DEVNULL, stdout=log, stderr=log)
        self._port = socket.socket(socket.AF_UNIX)
        machine.wait_until(self._connects, 20, "the emulator's start")
        self._answers = self._port.makefile("rb")
        self._wait_for_agent()

    def run(self, command):
        self._send(command)
        status, output, errors = self._receive().split(":")
        return check.Answer(int(status), _decoded(output), _decoded(errors))

    def restart(self):
        self._send(self.reboot)
        self._wait_for_agent()

    def stop(self):
        if self._process is not None:
            self._process.terminate()
            self._process.wait()
            self._process = None

    def _arguments(self):
        return ["qemu-system-x86_64", "-accel", "tcg", "-machine", "q35", "-cpu", "Nehalem", "-smp", "2", "-m", "1G",
                "-display", "none", "-nodefaults", "-nic", "none",
                "-chardev", f"file,id=console,path={self._folder}/console.log", "-serial", "chardev:console",
                "-chardev", f"socket,id=agent,path={self._folder}/agent,server=on,wait=on", "-serial", "chardev:agent",
                *map(str, self._devices)]

    def _connects(self):
        if self._process.poll() is not None:
            raise machine.Trouble("the emulator ended: " + (self._folder / "emulator.log").read_text())
        return self._port.connect_ex(str(self._folder / "agent")) == 0

    def _wait_for_agent(self):
        self._port.settimeout(BOOT_SECONDS)
        while self._receive() != "ready":
            pass
        self._port.settimeout(ANSWER_SECONDS)

    def _send(self, command):
        self._port.sendall(base64.b64encode(command.encode()) + b"\n")

    def _receive(self):
        try:
            line = self._answers.readline()
        except TimeoutError:
            line = b""
        if not line:
            console = (self._folder / "console.log").read_text(errors="replace")
            raise machine.Trouble("no answer; the console's end:\n" + console[-2000:])
        return line.decode(errors="replace").strip()


def _decoded(text):
    return base64.b64decode(text).decode(errors="replace")

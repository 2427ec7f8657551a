# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
from check import Check

CONTAINER, GUEST, SERVER = frozenset({"container"}), frozenset({"guest"}), frozenset({"server"})
NOT_HERE = "Not supported on this machine.\n"
# What wakes each card: "g" is a magic packet, "d" nothing.
CARDS = "for card in /sys/class/net/eth*; do ethtool ${card##*/} | sed -n 's/^\\tWake-on: //p' | grep . || echo none; done"
PORT = "cat /sys/class/tty/ttyS0/device/power/wakeup"

CHECKS = [
    Check("the one card that can wakes the machine", needs=GUEST,
          do="tavisk -setwakeonnetworkaccess on -getwakeonnetworkaccess",
          prints="setwakeonnetworkaccess: On\nWake On Network Access: On\n", then={CARDS: "g\nd\nd\nd\nnone\n"}),
    Check("no card wakes it", needs=GUEST, do="tavisk -setwakeonnetworkaccess off -getwakeonnetworkaccess",
          prints="setwakeonnetworkaccess: Off\nWake On Network Access: Off\n", then={CARDS: "d\nd\nd\nd\nnone\n"}),
    Check("the serial port that can wakes the machine", needs=GUEST,
          do="tavisk -setwakeonmodem on -getwakeonmodem", prints="setwakeonmodem: On\nWake On Modem: On\n",
          then={PORT: "enabled\n"}),
    Check("no serial port wakes it", needs=GUEST, do="tavisk -setwakeonmodem off -getwakeonmodem",
          prints="setwakeonmodem: Off\nWake On Modem: Off\n", then={PORT: "disabled\n"}),
] + [
    Check(f"nothing wakes this {name}", needs=needs, status=1,
          do="tavisk -getwakeonmodem -getwakeonnetworkaccess -setwakeonnetworkaccess on -setwakeonmodem on",
          prints="Wake On Modem: " + NOT_HERE + 2 * ("Wake On Network Access: " + NOT_HERE) + "Wake On Modem: " + NOT_HERE)
    for name, needs in (("container", CONTAINER), ("server", SERVER))
]

# SPDX-FileCopyrightText: 2026 The tavisk developers
# SPDX-License-Identifier: MIT
"""A management controller for an emulated machine. It keeps a power restore policy and a start-up delay, sees the lock of
the front panel, and knows no other request than those, its identity, and its state; the emulator's own protocol is
between them (frames of the bytes sequence number, function, command, data, checksum)."""

import socket
import threading

END_OF_MESSAGE, END_OF_CONTROL, ESCAPE = 0xA0, 0xA1, 0xAA
SUCCESS, UNKNOWN_REQUEST = 0x00, 0xC1
IDENTITY = bytes([0x20, 1, 1, 2, 2, 0x80, 0x57, 0x01, 0, 1, 0])  # of manufacturer 343
POLICIES = 0x07
PANEL_LOCK = 0x02
GET_IDENTITY, GET_ABILITIES, GET_STATE, SET_POLICY = (0x06, 0x01), (0x00, 0x00), (0x00, 0x01), (0x00, 0x06)
SET_DELAY, GET_DELAY = (0x30, 0x54), (0x30, 0x55)


class Controller:
    """Serves at a path until its process ends."""

    def __init__(self, path):
        self.policy = 0
        self.delay = bytes(2)
        self.locked = False
        self._listener = socket.socket(socket.AF_UNIX)
        self._listener.bind(str(path))
        self._listener.listen()
        threading.Thread(target=self._serve, daemon=True).start()

    def obey(self, command):
        """"controller tells" what it keeps; the panel "is locked" or "is open" from then on."""
        if command == "controller tells":
            return f"policy {self.policy}, delay {int.from_bytes(self.delay, 'big')}\n"
        self.locked = {"controller is locked": True, "controller is open": False}[command]
        return ""

    def _serve(self):
        while True:
            connection, _ = self._listener.accept()
            with connection:
                for message in _messages(connection):
                    connection.sendall(_framed(self._reply(message)))

    def _reply(self, message):
        sequence, function, command, *data = message[:-1]
        completion, answer = self._answer((function >> 2, command), bytes(data))
        return bytes([sequence, function | 4, command, completion]) + answer

    def _answer(self, request, data):
        if request == GET_IDENTITY:
            return SUCCESS, IDENTITY
        if request == GET_ABILITIES:
            return SUCCESS, bytes([PANEL_LOCK, 0x20, 0x20, 0x20, 0x20])
        if request == GET_STATE:
            return SUCCESS, bytes([1 | self.policy << 5, 0, PANEL_LOCK * self.locked])
        if request == SET_POLICY:
            self.policy = data[0] if data[0] < 3 else self.policy
            return SUCCESS, bytes([POLICIES])
        if request == SET_DELAY:
            self.delay = data
            return SUCCESS, b""
        if request == GET_DELAY:
            return SUCCESS, self.delay
        return UNKNOWN_REQUEST, b""


def _messages(connection):
    """The messages that come in; what the emulator says of itself is left out."""
    frame, escaped = bytearray(), False
    while received := connection.recv(256):
        for byte in received:
            if byte == END_OF_MESSAGE:
                yield bytes(frame)
            if byte in (END_OF_MESSAGE, END_OF_CONTROL):
                frame.clear()
            elif byte == ESCAPE:
                escaped = True
            else:
                frame.append(byte & ~0x10 if escaped else byte)
                escaped = False


def _framed(message):
    frame = bytearray()
    for byte in message + bytes([-sum(message) & 0xFF]):
        frame += bytes([ESCAPE, byte | 0x10]) if byte in (END_OF_MESSAGE, END_OF_CONTROL, ESCAPE) else bytes([byte])
    return bytes(frame + bytes([END_OF_MESSAGE]))

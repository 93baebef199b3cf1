# SPDX-License-Identifier: Apache-2.0
"""Monitors of an X server that is reached over the remote frame buffer protocol (RFC 6143), which lays them out."""

import socket
import struct

PORT = 5900
RAW, EXTENDED_DESKTOP_SIZE = 0, -308
SET_ENCODINGS, UPDATE_REQUEST, SET_DESKTOP_SIZE = 2, 3, 251
SCREEN = ">IHHHHI"


class Viewer:
    """As much of a viewer as it takes to be told of the monitors and to change them."""

    def __init__(self, connection):
        self.connection = connection
        self.read(12)
        self.connection.sendall(b"RFB 003.008\n")
        self.read(self.read(1)[0])
        self.connection.sendall(b"\1")  # no authentication
        self.read(4)
        self.connection.sendall(b"\1")  # shared
        self.read(20)
        self.read(struct.unpack(">I", self.read(4))[0])
        self.connection.sendall(struct.pack(">BxHii", SET_ENCODINGS, 2, RAW, EXTENDED_DESKTOP_SIZE))

    def read(self, count):
        return self.connection.recv(count, socket.MSG_WAITALL)

    def monitors(self):
        """The next report on the monitors, as (id, x, y, width, height, flags) each."""
        self.connection.sendall(struct.pack(">BBHHHH", UPDATE_REQUEST, 0, 0, 0, 1, 1))
        while True:
            for _ in range(struct.unpack(">xxH", self.read(4))[0]):
                _, _, width, height, encoding = struct.unpack(">HHHHi", self.read(12))
                if encoding == EXTENDED_DESKTOP_SIZE:
                    return [struct.unpack(SCREEN, self.read(16)) for _ in range(self.read(4)[0])]
                self.read(width * height * 4)

    def lay_out(self, size, screens):
        first = self.monitors()[0][0]
        self.connection.sendall(struct.pack(">BxHHBx", SET_DESKTOP_SIZE, *size, len(screens)) + b"".join(
            struct.pack(SCREEN, first + i, *screen, 0) for i, screen in enumerate(screens)))
        self.monitors()


def arrange(desktop, screens, primary):
    """Gives the desktop monitors at these places, (x, y, width, height) each; the primary one by its number."""
    with socket.create_connection(("127.0.0.1", PORT)) as connection:
        Viewer(connection).lay_out(map(int, desktop.size.split("x")), screens)
    desktop.wait("the monitors", lambda: f"VNC-{len(screens) - 1} connected" in desktop.run("xrandr"))
    desktop.run("xrandr", "--output", f"VNC-{primary}", "--primary")

# SPDX-License-Identifier: Apache-2.0
"""Drops what is sent to the platform, like a network that loses packets."""

import socket


class Firewall:
    """Steers the packet filter of the room through the process that may change it."""

    def __init__(self, descriptor, ports):
        """descriptor: a socket that takes a line of nft commands and answers with nft's exit status."""
        self._stream = socket.socket(fileno=descriptor).makefile("rw") if descriptor is not None else None
        self._ports = ", ".join(str(port) for port in ports)

    def black_hole(self, on):
        """Drops every packet to the ports, or none. The rule is in force on return."""
        if self._stream is None:
            raise RuntimeError("the platform was started without a way to the packet filter")
        rules = "delete table inet room"
        if on:
            rules = ("add table inet room; add chain inet room input { type filter hook input priority 0; }; "
                     f"add rule inet room input tcp dport {{ {self._ports} }} drop")
        self._stream.write(rules + "\n")
        self._stream.flush()
        status = self._stream.readline().strip()
        if status != "0":
            raise RuntimeError(f"nft ended with {status}; /run/room/room.log has its words")

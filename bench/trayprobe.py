# SPDX-License-Identifier: Apache-2.0
"""A tray host that only takes the time: an XEmbed tray on the room's X server that says when an icon asks for a place."""

import select
import time

from Xlib import X, display
from Xlib.protocol import event

REQUEST_DOCK = 0


class TrayProbe:
    """Owns the tray selection of a display from its making until it is closed."""

    def __init__(self, name):
        self._display = display.Display(name)
        screen = self._display.screen()
        self._window = screen.root.create_window(0, 0, 64, 64, 0, screen.root_depth)
        self._window.map()
        self._opcode = self._display.intern_atom("_NET_SYSTEM_TRAY_OPCODE")
        selection = self._display.intern_atom(f"_NET_SYSTEM_TRAY_S{self._display.get_default_screen()}")
        self._window.set_selection_owner(selection, X.CurrentTime)
        screen.root.send_event(
            event.ClientMessage(window=screen.root, client_type=self._display.intern_atom("MANAGER"),
                                data=(32, [X.CurrentTime, selection, self._window.id, 0, 0])),
            event_mask=X.StructureNotifyMask)
        self._display.sync()

    def wait_icon(self, timeout):
        """The moment (time.perf_counter) of the next icon's request, after which it is taken in; None without one."""
        end = time.perf_counter() + timeout
        while True:
            while self._display.pending_events():
                message = self._display.next_event()
                now = time.perf_counter()
                if message.type == X.ClientMessage and message.client_type == self._opcode \
                        and message.data[1][1] == REQUEST_DOCK:
                    icon = self._display.create_resource_object("window", message.data[1][2])
                    icon.reparent(self._window, 0, 0)
                    icon.map()
                    self._display.sync()
                    return now
            left = end - time.perf_counter()
            if left <= 0 or not select.select([self._display], [], [], left)[0]:
                return None

    def close(self):
        self._display.close()

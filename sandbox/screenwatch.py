# SPDX-License-Identifier: Apache-2.0
"""How soon a desktop's screen answers a click."""

import time

import roomclient
from Xlib import X, display
from Xlib.ext import xtest

# Between two clicks, so that a series spreads over some time.
PAUSE_SECONDS = 0.1
PATIENCE_SECONDS = 5


class ScreenWatch:
    """Clicks on a desktop's screen and looks at an area of it, (x, y, width, height)."""

    def __init__(self, desktop):
        self.area = None
        self.screen = display.Display(desktop.env["DISPLAY"])
        self.root = self.screen.screen().root

    def close(self):
        self.screen.close()

    def press(self, x, y, button=1):
        """A click of the mouse, sent from this process: starting one would be measured, too."""
        xtest.fake_input(self.screen, X.MotionNotify, x=x, y=y)
        xtest.fake_input(self.screen, X.ButtonPress, button)
        xtest.fake_input(self.screen, X.ButtonRelease, button)
        self.screen.flush()

    def look(self):
        """The pixels of the area."""
        return self.root.get_image(*self.area, X.ZPixmap, 0xFFFFFFFF).data

    def timed(self, place, wanted):
        """Clicks, and returns how many milliseconds it takes until the screen shows what is wanted."""
        time.sleep(PAUSE_SECONDS)
        start = time.monotonic()
        self.press(*place)
        while self.look() != wanted:
            if time.monotonic() - start > PATIENCE_SECONDS:
                break
            time.sleep(roomclient.POLL_SECONDS / 10)
        return (time.monotonic() - start) * 1000

    def settle(self, place):
        """Clicks and waits until the picture has stood still, which is then taken as what the click leads to."""
        self.press(*place)
        last, since = self.look(), time.monotonic()
        while time.monotonic() - since < 1:
            now = self.look()
            if now != last:
                last, since = now, time.monotonic()
        return last

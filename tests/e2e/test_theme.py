# SPDX-License-Identifier: Apache-2.0
"""Light and dark: windows that follow the desktop, those that do not, and texts that stand out in both."""

import os
import tempfile

from PIL import Image

from clienttest import CLIENT, ClientTest, roomclient, unittest

import contrast
from gallery import Gallery
from stage import PASSWORD, Stage

LIGHT, DARK = (0xfa, 0xfa, 0xfb), (0x25, 0x27, 0x2a)
# A point of each window where nothing but its surface is.
SURFACE = (150, 12)


class Live(ClientTest):
    def setUp(self):
        super().setUp()
        self.stage = Stage(self.desktop, tempfile.mkdtemp())

    def surface(self, window):
        """The colour of a window's surface on the screen."""
        path = os.path.join(self.stage.directory, "window.png")
        self.desktop.screenshot(path, window)
        with Image.open(path) as image:
            return image.convert("RGB").getpixel(SURFACE)

    def await_surface(self, window, colour):
        self.until(f"the surface {colour}", lambda: self.surface(window) == colour)

    def test_open_dialog_follows_a_portal_that_comes_later_and_the_panel_stays_light(self):
        panel = self.start_shown()
        self.stage.click(PASSWORD)
        dialog = self.stage.window(PASSWORD)
        self.await_surface(dialog, LIGHT)
        self.desktop.start_portal("none")
        for scheme, colour in (("dark", DARK), ("light", LIGHT), ("dark", DARK), ("none", LIGHT)):
            self.desktop.set_colour_scheme(scheme)
            self.await_surface(dialog, colour)
            self.assertEqual(self.surface(panel), LIGHT)


class Contrast(ClientTest):
    """Every window of the client, at the scale at which strokes are wide enough to measure."""

    scale = 2

    def check(self, theme):
        self.addCleanup(roomclient.patch_state, roomclient.state())
        self.desktop.start_notifications()
        self.desktop.start_portal(theme)
        gallery = Gallery(self.desktop, tempfile.mkdtemp(), CLIENT, theme)
        pictures = gallery.all()
        # The form that is on the screen for a second only may be missed.
        self.assertLessEqual(set(contrast.WINDOWS) - {"release-running"},
                             {contrast.Picture(path).window for path in pictures})
        self.assertEqual([verdict._asdict() for verdict in contrast.failures(pictures)], [])

    def test_light(self):
        self.check("light")

    def test_dark(self):
        self.check("dark")


if __name__ == "__main__":
    unittest.main()

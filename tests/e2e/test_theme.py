# SPDX-License-Identifier: Apache-2.0
"""Texts of every window that stand out on a light and on a dark desktop."""

import tempfile

from clienttest import CLIENT, ClientTest, roomclient

import contrast
from gallery import Gallery


class Contrast(ClientTest):
    """At the scale at which strokes are wide enough to measure."""

    scale = 2

    def check(self, theme):
        self.addCleanup(roomclient.patch_state, roomclient.state())
        self.desktop.start_notifications()
        self.desktop.start_portal(theme)
        pictures = Gallery(self.desktop, tempfile.mkdtemp(), CLIENT, theme).all()
        # The form that is on the screen for a second only may be missed.
        self.assertLessEqual(set(contrast.WINDOWS) - {"release-running"},
                             {contrast.Picture(path).window for path in pictures})
        self.assertEqual([verdict._asdict() for verdict in contrast.failures(pictures)], [])

    def test_light(self):
        self.check("light")

    def test_dark(self):
        self.check("dark")

# SPDX-License-Identifier: Apache-2.0
"""The tray icon and the panel on a real X server with a real tray host and window manager."""

from clienttest import ClientTest, roomclient, unittest

from stage import Stage

SCREEN = (1280, 800)


class Tray(ClientTest):
    def test_clicks(self):
        self.start()
        # The double click counts once, and the first click shows nothing.
        for times, reason in (({"repeat": 2}, 2), ({"button": 2}, 4)):
            self.desktop.click_icon(**times)
            roomclient.wait_syslog(f"reason : {reason}")
        self.assertEqual(sum("winstatus" in line for line in roomclient.syslog_lines()), 1)
        self.assertIsNone(self.desktop.panel())
        # A right click makes the next left click show.
        self.show_panel()
        self.desktop.click_icon()
        self.wait_hidden()

    def test_panel_as_a_window(self):
        stage = Stage(self.desktop)
        panel = self.start_shown()
        self.until("the panel with its scenes", lambda: self.desktop.geometry(panel)[3] == 565)
        x, y, width, height = self.desktop.geometry(panel)
        # The tray host reserves 36 pixels along the bottom.
        self.assertEqual((x + width, y + height), (SCREEN[0], SCREEN[1] - 36))
        self.desktop.run("xdotool", "mousemove", str(x + 100), str(y + 20), "mousedown", "1",
                         "mousemove_relative", "--sync", "--", "-150", "-60",
                         "mousemove_relative", "--sync", "--", "-50", "-40", "mouseup", "1")
        self.until("the panel to move", lambda: self.desktop.geometry(panel)[:2] == (x - 200, y - 100))
        for state in (True, False):
            stage.click("置顶显示")

            def settled(wanted=state):
                window = self.desktop.panel()
                text = self.desktop.run("xprop", "-id", window) if window else ""
                return "_NET_FRAME_EXTENTS" in text and ("_NET_WM_STATE_ABOVE" in text) == wanted and text

            text = self.until("the window state", settled)
            self.assertRegex(text, r"_NET_FRAME_EXTENTS\(CARDINAL\) = 0, 0, 0, 0")
        self.desktop.run("wmctrl", "-i", "-c", self.desktop.panel())
        self.wait_hidden()
        self.desktop.click_icon()
        self.desktop.wait("the panel", self.desktop.panel)
        stage.click("关闭")
        self.wait_hidden()


class LateTray(ClientTest):
    tray = False

    def test_panel_keeps_clear_of_a_desktop_panel_that_comes_later(self):
        self.start()
        self.until("the placing", lambda: any("resetUIPos" in line for line in self.messages()))
        self.desktop.start_tray("left")
        panel = self.show_panel()

        def corner():
            x, y, width, height = self.desktop.geometry(panel)
            return x + width, y + height

        self.until("the place in the corner", lambda: corner() == (SCREEN[0] - 36, SCREEN[1]))


if __name__ == "__main__":
    unittest.main()

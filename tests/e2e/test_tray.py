"""The tray icon and the panel on a real X server with a real tray host and window manager."""

from clienttest import SYSLOG, ClientTest, roomclient, unittest, write

SCREEN = (1280, 800)
ON_TOP_BOX = (20, -32)


class Tray(ClientTest):
    def test_three_left_clicks(self):
        self.start()
        self.desktop.click_icon()
        roomclient.wait_syslog("winstatus :  0")
        self.assertIsNone(self.desktop.panel())
        self.desktop.click_icon()
        self.desktop.wait("the panel", self.desktop.panel)
        self.desktop.click_icon()
        self.wait_hidden()

    def test_right_click_makes_the_next_left_click_show(self):
        self.start_shown()
        write(SYSLOG, b"")
        self.desktop.click_icon(button=3)
        roomclient.wait_syslog("reason : 1")
        self.desktop.click_icon()
        roomclient.wait_for(lambda: any("reason : 3" in line for line in roomclient.syslog_lines()))
        self.assertIsNotNone(self.desktop.panel())

    def test_double_click_counts_once_and_middle_click_not_at_all(self):
        self.start()
        self.desktop.click_icon(repeat=2)
        roomclient.wait_syslog("reason : 2")
        self.desktop.click_icon(button=2)
        roomclient.wait_syslog("reason : 4")
        self.assertEqual(sum("winstatus" in line for line in roomclient.syslog_lines()), 1)

    def test_closing_by_the_window_manager_hides(self):
        panel = self.start_shown()
        self.desktop.run("wmctrl", "-i", "-c", panel)
        self.wait_hidden()
        roomclient.wait_syslog("closeEvent --------")
        self.assertIsNone(self.client.poll())
        self.desktop.click_icon()
        self.desktop.wait("the panel", self.desktop.panel)


class Panel(ClientTest):
    def test_place_and_frame(self):
        panel = self.start_shown()
        self.until("the panel with its scenes", lambda: self.desktop.geometry(panel)[3] == 565)
        x, y, width, height = self.desktop.geometry(panel)
        # The tray host reserves 36 pixels along the bottom.
        self.assertEqual((x + width, y + height), (SCREEN[0], SCREEN[1] - 36))
        self.assertNotIn("_NET_FRAME_EXTENTS(CARDINAL) = 1", self.desktop.run("xprop", "-id", panel))

    def test_on_top_keeps_the_panel_frameless_and_visible(self):
        panel = self.start_shown()
        self.until("the panel with its scenes", lambda: self.desktop.geometry(panel)[3] == 565)
        for state in (True, False):
            x, y, _, height = self.desktop.geometry(self.desktop.panel())
            self.desktop.click(x + ON_TOP_BOX[0], y + height + ON_TOP_BOX[1])

            def settled(wanted=state):
                window = self.desktop.panel()
                text = self.desktop.run("xprop", "-id", window) if window else ""
                return "_NET_FRAME_EXTENTS" in text and ("_NET_WM_STATE_ABOVE" in text) == wanted and text

            text = self.until("the window state", settled)
            self.assertRegex(text, r"_NET_FRAME_EXTENTS\(CARDINAL\) = 0, 0, 0, 0")

    def test_close_button_and_dragging(self):
        panel = self.start_shown()
        self.until("the panel with its scenes", lambda: self.desktop.geometry(panel)[3] == 565)
        x, y, width, _ = self.desktop.geometry(panel)
        self.desktop.run("xdotool", "mousemove", str(x + 100), str(y + 20), "mousedown", "1",
                         "mousemove_relative", "--sync", "--", "-150", "-60",
                         "mousemove_relative", "--sync", "--", "-50", "-40", "mouseup", "1")
        self.until("the panel to move", lambda: self.desktop.geometry(panel)[:2] == (x - 200, y - 100))
        self.desktop.click_panel(width - 24, 24)
        self.wait_hidden()
        self.assertIsNone(self.client.poll())


class LateTray(ClientTest):
    tray = False

    def test_panel_keeps_clear_of_a_desktop_panel_that_comes_later(self):
        for edge, place in (("left", (SCREEN[0] - 36, SCREEN[1])), ("top", (SCREEN[0], SCREEN[1] - 36))):
            with self.subTest(edge):
                write(SYSLOG, b"")
                self.start()
                self.until("the placing", lambda: any("resetUIPos" in line for line in self.messages()))
                host = self.desktop.start_tray(edge)
                panel = self.show_panel()

                def corner(window=panel):
                    x, y, width, height = self.desktop.geometry(window)
                    return x + width, y + height

                self.until("the place in the corner", lambda wanted=place: corner() == wanted)
                for process in (self.client, host):
                    process.terminate()
                    process.wait(5)


if __name__ == "__main__":
    unittest.main()

"""Shows the client on a small desktop inside a room and takes pictures of it.

    demo.py CLIENT PICTURES [--window]

CLIENT is the program, PICTURES the directory for the PNG files. With --window the desktop is a Xephyr window on the
display given by the environment, and stays until that window is closed.
"""

import argparse
import os
import sys

import roomclient
from desktop import Desktop, stop

# Where the page buttons lie in the panel.
LOGIN_BUTTON = (85, 145)
NETWORK_BUTTON = (215, 145)
BACKGROUND = "#3d5a80"


def take_pictures(desktop, directory):
    """Opens the panel from the tray and takes a picture of each page."""
    # The first left click after the start only hides the hidden panel; a right click before it makes it show.
    desktop.click_icon(button=3)
    desktop.click_icon()
    desktop.wait("the panel", desktop.panel)
    roomclient.wait_record(lambda entry: entry.get("path") == "/api/client/area/scenes", 15)
    desktop.wait("the scene box", lambda: desktop.geometry(desktop.panel())[3] > 520)
    for name, button in (("login", LOGIN_BUTTON), ("network", NETWORK_BUTTON)):
        asked = len(roomclient.record("dbus", method="GetActiveConnectionInfo"))
        desktop.click_panel(*button)
        desktop.wait("the page", lambda: len(roomclient.record("dbus", method="GetActiveConnectionInfo")) > asked)
        desktop.run("xdotool", "mousemove", "400", "300")
        settle(desktop)
        desktop.screenshot(os.path.join(directory, f"panel-{name}.png"), desktop.panel())
        desktop.screenshot(os.path.join(directory, f"desktop-{name}.png"))


def settle(desktop):
    """Waits until two pictures in a row are the same, so that none is taken in the middle of painting."""
    last = [None]

    def unchanged():
        picture = desktop.run("sh", "-c", "import -window root rgb:- | sha256sum")
        same, last[0] = picture == last[0], picture
        return same

    desktop.wait("a steady picture", unchanged)


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("client")
    parser.add_argument("pictures")
    parser.add_argument("--window", action="store_true")
    options = parser.parse_args()
    os.makedirs(options.pictures, exist_ok=True)
    with Desktop(server="Xephyr" if options.window else "Xvfb") as desktop:
        desktop.set_background(BACKGROUND)
        desktop.start_window_manager()
        desktop.start_tray()
        client = desktop.start_client(options.client)
        desktop.wait("the tray icon", desktop.icon)
        take_pictures(desktop, options.pictures)
        if options.window:
            print("The desktop is yours: click the tray icon. Close the window to end the demo.", flush=True)
            desktop.x.wait()
            return 0
        status = stop(client)
    print(f"pictures: {options.pictures}")
    return status


if __name__ == "__main__":
    sys.exit(main())

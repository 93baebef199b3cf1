# SPDX-License-Identifier: Apache-2.0
"""The desktops that people have, each with its own panel, window manager, notification service and Qt plugin."""

import os
import shutil
import subprocess
import time

import numpy
import roomclient
from desktop import Desktop, end

HOME = os.environ.get("HOME", "")
SERVICES = "/usr/share/dbus-1/services"
THICKNESS = 36
# Longer than any desktop's time for a double click.
CLICK_PAUSE_SECONDS = 0.6


def write(path, text):
    path = os.path.join(HOME, path)
    os.makedirs(os.path.dirname(path), exist_ok=True)
    with open(path, "w", encoding="utf-8") as stream:
        stream.write(text)
    return path


class RealDesktop(Desktop):
    """What the desktops have in common; a desktop says how its parts are started and set up."""

    variables = {}
    window_manager = ()
    panel_class = ""
    panel_command = ()
    notifier_class = ""
    notifier_command = ()
    # Where a click on a notification opens what it tells of; negative numbers count from its right and bottom.
    notification_spot = (120, 50)

    def __init__(self, **options):
        super().__init__(**options)
        self.env.update(self.variables)
        self.bar = None

    def start(self, edge="bottom", compositor=False, bar=True):
        """The whole desktop, with its panel unless told otherwise."""
        self.configure(edge)
        self.start_session()
        self.spawn([*self.window_manager])
        self.wait("the window manager", lambda: "_NET_SUPPORTING_WM_CHECK(WINDOW)" in
                  self.run("xprop", "-root", "_NET_SUPPORTING_WM_CHECK"), 60)
        if compositor:
            self.spawn(["picom", "--backend", "xrender"])
        if self.notifier_command:
            self.spawn([*self.notifier_command])
        if bar:
            self.start_bar()

    def click_notification(self, window):
        left, top, width, height = self.geometry(window)
        x, y = self.notification_spot
        self.click(left + x % width, top + y % height)

    def start_session(self):
        """What the desktop's other parts need."""

    def start_bar(self):
        """Starts the desktop's panel and waits until it has reserved its place."""
        self.bar = self.spawn([*self.panel_command])
        self.wait("the desktop's panel", lambda: self._bar() and "_STRUT" in self.run("xprop", "-id", self._bar()[0]),
                  60)
        self.wait("the tray", lambda: "true" in self.registry("IsStatusNotifierHostRegistered"), 60)

    def stop_bar(self):
        end(self.bar)
        self.wait("the desktop's panel to go", lambda: not self.bar_area())

    def _bar(self):
        """Window and place of the desktop's panel; some slide in from outside."""
        width, height = map(int, self.size.split("x"))
        return next(((window, (x, y, *extent)) for window, (x, y, *extent) in self.windows(self.panel_class)
                     if min(extent) <= 2 * THICKNESS and max(extent) >= 600 and 0 <= x <= width - extent[0]
                     and 0 <= y <= height - extent[1]), None)

    def bar_area(self):
        """(x, y, width, height) of the desktop's panel; None while it is not there."""
        return (self._bar() or (None, None))[1]

    def _pixels(self, box):
        """Red, green and blue of a part of the screen."""
        x, y, width, height = box
        picture = subprocess.run(["import", "-window", "root", "-crop", f"{width}x{height}+{x}+{y}", "-depth", "8",
                                  "rgb:-"], env=self.env, capture_output=True, check=True).stdout
        return numpy.frombuffer(picture, numpy.uint8).reshape(height, width, 3).astype(int)

    def halves(self):
        """The two halves of the desktop's panel, the task bar's and the tray's."""
        x, y, width, height = self.bar_area()
        if width > height:
            return (x, y, width // 2, height), (x + width // 2, y, width // 2, height)
        return (x, y, width, height // 2), (x, y + height // 2, width, height // 2)

    def icon(self):
        """Where the tray has the colour of our icon; None unless it covers a fifth of an item's square."""
        if not self.bar_area():
            return None
        area = self.halves()[1]
        red, green, blue = numpy.moveaxis(self._pixels(area), 2, 0)
        rows, columns = numpy.nonzero((blue > 150) & (blue - red > 110) & (green > 60) & (green < 165))
        if len(rows) < THICKNESS ** 2 / 5:
            return None
        left, top = min(columns), min(rows)
        return area[0] + left, area[1] + top, max(columns) - left + 1, max(rows) - top + 1

    def task_bar(self):
        """The task bar as it looks."""
        return self._pixels(self.halves()[0])

    def click_once(self):
        """A click on the icon that no other one makes a double click; returns when the client has met it."""
        before = len(roomclient.syslog_lines())
        self.click_icon()
        self.wait("the click", lambda: any("reason : 3" in line for line in roomclient.syslog_lines()[before:]))
        # Some light up the icon below the pointer.
        self.run("xdotool", "mousemove", "400", "300")
        time.sleep(CLICK_PAUSE_SECONDS)

    def show_panel(self):
        """The client's panel: the first click only counts, the second shows it."""
        for _ in range(2):
            self.click_once()
        return self.wait("the panel", self.panel)

    def open_maximized(self):
        """Another program's window over the whole work area, in which the user is busy."""
        self.spawn(["xmessage", "-name", "other", "..."])
        window, _ = self.wait("the other window", lambda: self.windows("other"))[0]
        self.run("wmctrl", "-i", "-r", window, "-b", "add,maximized_vert,maximized_horz")
        self.wait("a large window", lambda: self.geometry(window)[2] > 1000)
        self.click(500, 400)
        self.wait_active(window)

    def wait_active(self, window):
        self.wait("the focus", lambda: self.active() == int(window, 16))

    def active(self):
        """The id of the window that has the focus."""
        return int(self.run("xdotool", "getactivewindow").strip() or 0)

    def provide(self, *names):
        """Lets the session bus start these services on this desktop."""
        self.run("dbus-update-activation-environment", "DISPLAY", "XDG_CURRENT_DESKTOP")
        for name in names:
            shutil.copy(f"{SERVICES}/{name}.service", os.path.join(os.environ["ROOM"], "dbus/session-services"))
        self.run("gdbus", "call", "--session", "-d", "org.freedesktop.DBus", "-o", "/org/freedesktop/DBus",
                 "-m", "org.freedesktop.DBus.ReloadConfig")


class Xfce(RealDesktop):
    variables = {"XDG_CURRENT_DESKTOP": "XFCE", "DESKTOP_SESSION": "xfce"}
    window_manager = ("xfwm4", "--compositor=off")
    panel_class = "xfce4-panel"
    panel_command = ("xfce4-panel", "--disable-wm-check")
    notifier_class = "xfce4-notifyd"
    notifier_command = ("/usr/lib/x86_64-linux-gnu/xfce4/notifyd/xfce4-notifyd",)
    notification_spot = (-60, -30)

    def configure(self, edge):
        # p: the corner or edge that the panel snaps to; mode: 0 lies, 1 stands.
        place, mode = {"bottom": ("p=10;x=0;y=0", 0), "top": ("p=11;x=0;y=0", 0), "left": ("p=5;x=0;y=0", 1),
                       "right": ("p=1;x=0;y=0", 1)}[edge]
        def value(name, kind, content):
            return f'<property name="{name}" type="{kind}" value="{content}"/>'
        write(".config/xfce4/xfconf/xfce-perchannel-xml/xfce4-panel.xml", f"""<?xml version="1.0"?>
<channel name="xfce4-panel" version="1.0">{value("configver", "int", 2)}
<property name="panels" type="array"><value type="int" value="1"/><property name="panel-1" type="empty">
{value("position", "string", place)}{value("mode", "uint", mode)}{value("length", "uint", 100)}
{value("size", "uint", THICKNESS)}{value("position-locked", "bool", "true")}{value("output-name", "string", "Primary")}
<property name="plugin-ids" type="array"><value type="int" value="1"/><value type="int" value="2"/>
<value type="int" value="3"/></property></property></property>
<property name="plugins" type="empty"><property name="plugin-1" type="string" value="tasklist"/>
<property name="plugin-2" type="string" value="separator">{value("expand", "bool", "true")}</property>
<property name="plugin-3" type="string" value="systray">{value("icon-size", "uint", 22)}</property></property>
</channel>""")

    def start_session(self):
        self.spawn(["/usr/lib/x86_64-linux-gnu/xfce4/xfconf/xfconfd"])
        self.wait("the settings", lambda: self.run("xfconf-query", "-c", "xfce4-panel", "-p", "/configver"))


class Lxqt(RealDesktop):
    variables = {"XDG_CURRENT_DESKTOP": "LXQt", "DESKTOP_SESSION": "lxqt", "QT_QPA_PLATFORMTHEME": "lxqt"}
    window_manager = ("openbox",)
    panel_class = "lxqt-panel"
    panel_command = ("lxqt-panel",)
    notifier_class = "lxqt-notificationd"
    notifier_command = ("lxqt-notificationd",)

    def configure(self, edge):
        write(".config/lxqt/lxqt.conf", "[General]\ntheme=light\nicon_theme=breeze\n")
        write(".config/lxqt/panel.conf", f"""[General]
panels=main
[main]
position={edge.capitalize()}
desktop=0
alignment=-1
width=100
width-percent=true
panelSize={THICKNESS}
iconSize=22
lineCount=1
plugins=taskbar, statusnotifier
[taskbar]
type=taskbar
alignment=Left
[statusnotifier]
type=statusnotifier
alignment=Right
""")


class Mate(RealDesktop):
    variables = {"XDG_CURRENT_DESKTOP": "MATE", "DESKTOP_SESSION": "mate"}
    window_manager = ("marco", "--no-composite")
    panel_class = "mate-panel"
    panel_command = ("mate-panel",)
    notifier_class = "mate-notification-daemon"
    notifier_command = ("/usr/lib/mate-notification-daemon/mate-notification-daemon",)

    def configure(self, edge):
        write(".config/glib-2.0/settings/keyfile", f"""[org/mate/panel/general]
toplevel-id-list=['main']
object-id-list=['tray', 'tasks']
[org/mate/panel/toplevels/main]
orientation='{edge}'
size={THICKNESS}
expand=true
screen=0
[org/mate/panel/objects/tasks]
object-type='applet'
applet-iid='WnckletFactory::WindowListApplet'
toplevel-id='main'
position=0
[org/mate/panel/objects/tray]
object-type='applet'
applet-iid='NotificationAreaAppletFactory::NotificationArea'
toplevel-id='main'
position=0
panel-right-stick=true
relative-to-edge='end'
""")

    def start_session(self):
        self.provide("org.mate.panel.applet.NotificationAreaAppletFactory", "org.mate.panel.applet.WnckletFactory")


class Plasma(RealDesktop):
    variables = {"XDG_CURRENT_DESKTOP": "KDE", "DESKTOP_SESSION": "plasma", "KDE_FULL_SESSION": "true",
                 "KDE_SESSION_VERSION": "5", "QT_QUICK_BACKEND": "software", "KWIN_COMPOSE": "N"}
    window_manager = ("kwin_x11",)
    panel_class = "plasmashell"
    panel_command = ("plasmashell",)
    notifier_class = "plasmashell"

    def configure(self, edge):
        location = {"top": 3, "bottom": 4, "left": 5, "right": 6}[edge]
        form = 2 if edge in ("top", "bottom") else 3
        write(".config/plasma-org.kde.plasma.desktop-appletsrc", f"""[Containments][1]
activityId=
formfactor=0
immutability=1
lastScreen=0
location=0
plugin=org.kde.desktopcontainment
wallpaperplugin=org.kde.color

[Containments][2]
activityId=
formfactor={form}
immutability=1
lastScreen=0
location={location}
plugin=org.kde.panel
wallpaperplugin=org.kde.image

[Containments][2][Applets][3]
immutability=1
plugin=org.kde.plasma.taskmanager

[Containments][2][Applets][4]
immutability=1
plugin=org.kde.plasma.systemtray

[Containments][2][Applets][4][Configuration]
SystrayContainmentId=5

[Containments][2][General]
AppletOrder=3;4

[Containments][5]
activityId=
formfactor={form}
immutability=1
lastScreen=0
location={location}
plugin=org.kde.plasma.private.systemtray

[Containments][5][General]
extraItems=org.kde.plasma.notifications
knownItems=org.kde.plasma.notifications
""")
        write(".config/plasmashellrc", f"""[PlasmaViews][Panel 2][Defaults]
thickness={THICKNESS}
""")

    def start_session(self):
        for command in (["kactivitymanagerd"], ["kded5"]):
            self.spawn([f"/usr/lib/x86_64-linux-gnu/libexec/{command[0]}"] if command[0] != "kded5" else command)

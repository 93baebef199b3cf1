// SPDX-License-Identifier: Apache-2.0
#include "screen/screens.h"

#include <NETWM>
#include <QGuiApplication>
#include <QScreen>
#include <QWidget>
#include <QX11Info>

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <xcb/xcb.h>

namespace
{

/// The X display's size in its own pixels.
QSize displaySize()
{
    struct Free {
        void operator()(void* reply) const { std::free(reply); }
    };
    xcb_connection_t* connection = QX11Info::connection();
    const auto cookie = xcb_get_geometry(connection, static_cast<xcb_drawable_t>(QX11Info::appRootWindow()));
    const std::unique_ptr<xcb_get_geometry_reply_t, Free> reply(xcb_get_geometry_reply(connection, cookie, nullptr));
    return reply ? QSize(reply->width, reply->height) : QSize();
}

bool isReservation(const NETExtendedStrut& bands)
{
    return bands.left_width + bands.right_width + bands.top_width + bands.bottom_width > 0;
}

/// What `window` reserves along the display's edges; a window that names no range reserves the whole edge.
NETExtendedStrut reservedBy(xcb_window_t window, const QSize& display)
{
    const NETWinInfo info(QX11Info::connection(), window, static_cast<xcb_window_t>(QX11Info::appRootWindow()),
                          NET::WMStrut, NET::WM2ExtendedStrut);
    NETExtendedStrut bands = info.extendedStrut();
    const NETStrut plain = info.strut();
    if (!isReservation(bands)) {
        bands.left_width = plain.left;
        bands.right_width = plain.right;
        bands.top_width = plain.top;
        bands.bottom_width = plain.bottom;
        bands.left_end = bands.right_end = display.height();
        bands.top_end = bands.bottom_end = display.width();
    }
    return bands;
}

/// `area` without the bands. One that would leave nothing of it crosses it on the way to another screen's panel.
QRect without(const NETExtendedStrut& bands, QRect area, const QSize& display)
{
    const QRect all(QPoint(), display);
    const int leftHeight = bands.left_end - bands.left_start + 1;
    const int rightHeight = bands.right_end - bands.right_start + 1;
    const int topWidth = bands.top_end - bands.top_start + 1;
    const int bottomWidth = bands.bottom_end - bands.bottom_start + 1;
    const int rightX = all.width() - bands.right_width;
    const int bottomY = all.height() - bands.bottom_width;
    const struct {
        QRect band;
        QRect rest;
    } edges[] = {
        {{0, bands.left_start, bands.left_width, leftHeight}, all.adjusted(bands.left_width, 0, 0, 0)},
        {{rightX, bands.right_start, bands.right_width, rightHeight}, all.adjusted(0, 0, -bands.right_width, 0)},
        {{bands.top_start, 0, topWidth, bands.top_width}, all.adjusted(0, bands.top_width, 0, 0)},
        {{bands.bottom_start, bottomY, bottomWidth, bands.bottom_width}, all.adjusted(0, 0, 0, -bands.bottom_width)},
    };
    for (const auto& [band, rest] : edges) {
        if (band.intersects(area) && rest.intersects(area))
            area = area.intersected(rest);
    }
    return area;
}

/// What the windows' own reservations leave of a screen; without any, the window manager's one rectangle for all
/// screens.
QRect workArea(const QRect& screen)
{
    const NETRootInfo root(QX11Info::connection(), NET::ClientList | NET::CurrentDesktop | NET::WorkArea);
    const QSize display = displaySize();
    QRect area = screen;
    bool reserved = false;
    for (int i = 0; i < root.clientListCount(); ++i) {
        const NETExtendedStrut bands = reservedBy(root.clientList()[i], display);
        reserved = reserved || isReservation(bands);
        area = without(bands, area, display);
    }
    if (reserved)
        return area;
    const NETRect managed = root.workArea(root.currentDesktop());
    const QRect common = screen.intersected({managed.pos.x, managed.pos.y, managed.size.width, managed.size.height});
    return common.isEmpty() ? screen : common;
}

} // namespace

namespace zent::screens
{

QRect availableGeometry()
{
    const QScreen* screen = QGuiApplication::primaryScreen();
    if (!screen)
        return {};
    // With several screens Qt takes each as available in full.
    if (QGuiApplication::screens().size() < 2 || !QX11Info::isPlatformX11())
        return screen->availableGeometry();
    // Where a screen begins is not scaled.
    const QPoint origin = screen->geometry().topLeft();
    const qreal scale = screen->devicePixelRatio();
    const QRect area = workArea({origin, screen->geometry().size() * scale});
    return {origin + (area.topLeft() - origin) / scale, area.size() / scale};
}

QRect fullGeometry()
{
    const QScreen* screen = QGuiApplication::primaryScreen();
    return screen ? screen->geometry() : QRect();
}

QList<QRect> all()
{
    QList<QRect> geometries;
    const QList<QScreen*> screens = QGuiApplication::screens();
    for (const QScreen* screen : screens)
        geometries.append(screen->geometry());
    return geometries;
}

QPoint bottomRight(const QRect& area, const QSize& window)
{
    return {area.width() - window.width(), area.height() - window.height()};
}

QPoint centre(const QRect& screen, const QSize& window)
{
    return {screen.width() / 2 - window.width() / 2, screen.height() / 2 - window.height() / 2};
}

bool showWhole(const QList<QRect>& screens, const QRect& window)
{
    return std::any_of(screens.begin(), screens.end(), [&](const QRect& screen) { return screen.contains(window); });
}

void keepInWorkArea(QWidget& window)
{
    const QRect area = availableGeometry();
    if (!area.contains(window.frameGeometry()))
        window.move(area.topLeft() + bottomRight(area, window.size()));
}

void placeBottomRight(QWidget& window, const QRect& area)
{
    window.move(bottomRight(area, window.size()));
    keepInWorkArea(window);
}

void placeCentre(QWidget& window)
{
    window.move(centre(fullGeometry(), window.size()));
}

void watch(QObject* context, const std::function<void()>& react)
{
    const auto watchOne = [context, react](const QScreen* screen) {
        QObject::connect(screen, &QScreen::geometryChanged, context, react);
        QObject::connect(screen, &QScreen::availableGeometryChanged, context, react);
    };
    const QList<QScreen*> screens = QGuiApplication::screens();
    for (const QScreen* screen : screens)
        watchOne(screen);
    QObject::connect(qGuiApp, &QGuiApplication::screenAdded, context, watchOne);
    QObject::connect(qGuiApp, &QGuiApplication::primaryScreenChanged, context, react);
    // Queued: while the signal is out, the removed screen is still among the others.
    QObject::connect(qGuiApp, &QGuiApplication::screenRemoved, context, react, Qt::QueuedConnection);
}

} // namespace zent::screens

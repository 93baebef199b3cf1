// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QList>
#include <QRect>

#include <functional>

class QObject;
class QWidget;

/// Where the desktop's screens are, and where the client's windows go on them.
namespace zent::screens
{

/// The work area: what desktop panels leave of the primary screen, also on a desktop of several screens.
QRect availableGeometry();

/// The primary screen, panels included.
QRect fullGeometry();

/// Every screen of the desktop, panels included.
QList<QRect> all();

/// Where a window of this size stands when its bottom-right corner lies `area`'s width and height away from the origin.
/// The area's own top-left corner plays no part, as agreed.
QPoint bottomRight(const QRect& area, const QSize& window);

/// Where a window of this size stands in the middle of a screen of `screen`'s size at the origin, each half rounded
/// toward zero.
QPoint centre(const QRect& screen, const QSize& window);

/// Whether one of the screens shows the whole of `window`.
bool showWhole(const QList<QRect>& screens, const QRect& window);

/// Moves `window` to the bottom right of the work area unless all of it is in that area. A window higher than the area
/// keeps its lower end in sight.
void keepInWorkArea(QWidget& window);

/// Moves `window` to bottomRight() of `area`, or to the bottom right of the work area where it would not be wholly in
/// it.
void placeBottomRight(QWidget& window, const QRect& area);

/// Moves `window` to the centre() of the primary screen.
void placeCentre(QWidget& window);

/// Calls `react` whenever a screen has come, gone, or changed its geometry or its reserved bands; ends with `context`.
void watch(QObject* context, const std::function<void()>& react);

} // namespace zent::screens

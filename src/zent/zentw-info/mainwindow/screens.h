#pragma once

#include <QList>
#include <QRect>

#include <functional>

class QObject;
class QWidget;

/// Where the desktop's screens are, and where the client's windows go on them.
namespace zent::screens
{

/// The default screen without the bands that desktop panels reserve.
QRect availableGeometry();

/// The primary screen, panels included.
QRect fullGeometry();

/// The primary screen without the reserved bands.
QRect primaryAvailableGeometry();

/// Every screen of the desktop, panels included.
QList<QRect> all();

/// Where a window of this size stands when its bottom-right corner lies `area`'s width and height away from the origin.
/// The area's own top-left corner plays no part: sites with a panel at the left or top rely on where the window then
/// stands. A window higher than the area keeps its lower end in sight.
QPoint bottomRight(const QRect& area, const QSize& window);

/// Where a window of this size stands in the middle of a screen of `screen`'s size at the origin, each half rounded
/// toward zero.
QPoint centre(const QRect& screen, const QSize& window);

/// Whether one of the screens shows the whole of `window`.
bool showWhole(const QList<QRect>& screens, const QRect& window);

/// Moves `window` to bottomRight() of `area`.
void placeBottomRight(QWidget& window, const QRect& area);

/// Moves `window` to the centre() of the primary screen.
void placeCentre(QWidget& window);

/// Calls `react` whenever a screen has come, gone, or changed its geometry or its reserved bands; ends with `context`.
void watch(QObject* context, const std::function<void()>& react);

} // namespace zent::screens

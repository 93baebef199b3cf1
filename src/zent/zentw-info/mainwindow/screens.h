#pragma once

#include <QRect>

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

/// Moves `window` so that its bottom-right corner lies `area`'s width and height away from the origin. The area's own
/// top-left corner plays no part: sites with a panel at the left or top rely on where the window then stands.
void placeBottomRight(QWidget& window, const QRect& area);

/// Moves `window` to the middle of the primary screen, each half rounded toward zero.
void placeCentre(QWidget& window);

} // namespace zent::screens

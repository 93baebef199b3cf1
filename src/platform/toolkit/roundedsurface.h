#pragma once

#include <QRegion>

class QColor;
class QWidget;

/** The rounded shape that the toolkit's frameless windows and panels share. */
namespace roundedsurface
{

/// The pixels of @p rect that lie inside its corners rounded by @p radius.
QRegion region(const QRect& rect, int radius);

/// Gives a window its outline: none under a compositing manager, where the painted surface ends softly, else a shape
/// cut into the window. Returns whether the window is composited.
bool applyShape(QWidget* window, int radius);

/// Paints the surface and its hairline border over the whole of @p widget. A widget that is @p cut to shape is filled
/// to its edges: nothing lies behind its corners that half-covered pixels could blend with.
void paint(QWidget* widget, const QColor& color, int radius, bool cut);

} // namespace roundedsurface

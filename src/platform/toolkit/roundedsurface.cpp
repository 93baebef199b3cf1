#include "roundedsurface.h"

#include "windowmanagerhelper.h"

#include <QPainter>
#include <QVector>
#include <QWidget>
#include <QX11Info>
#include <QtMath>

#include <cmath>

// Last: its macros are words that Qt uses.
#include <X11/Xlib.h>
#include <X11/extensions/shape.h>

namespace
{

/// Cuts an X window to its rounded shape, in the screen's own pixels: a widget's mask is as coarse as its scale.
void cutX11(QWidget* window, int radius)
{
    const qreal ratio = window->devicePixelRatioF();
    const QRect pixels(0, 0, qCeil(window->width() * ratio), qCeil(window->height() * ratio));
    QVector<XRectangle> rectangles;
    for (const QRect& part : roundedsurface::region(pixels, qRound(radius * ratio))) {
        rectangles.append({static_cast<short>(part.x()), static_cast<short>(part.y()),
                           static_cast<unsigned short>(part.width()), static_cast<unsigned short>(part.height())});
    }
    XShapeCombineRectangles(QX11Info::display(), window->winId(), ShapeBounding, 0, 0, rectangles.data(),
                            rectangles.size(), ShapeSet, Unsorted);
    XFlush(QX11Info::display());
}

} // namespace

QRegion roundedsurface::region(const QRect& rect, int radius)
{
    // Row by row: a region made from a path's polygon has visibly cut corners.
    QRegion region(rect.adjusted(0, radius, 0, -radius));
    for (int row = 0; row < radius; ++row) {
        const qreal height = radius - row - 0.5;
        const int inset = qRound(radius - std::sqrt(qreal(radius) * radius - height * height));
        const QRect line(rect.left() + inset, rect.top() + row, rect.width() - 2 * inset, 1);
        region += line;
        region += line.translated(0, rect.height() - 1 - 2 * row);
    }
    return region;
}

bool roundedsurface::applyShape(QWidget* window, int radius)
{
    const bool composited = WindowManagerHelper::instance()->hasComposite();
    if (QX11Info::isPlatformX11()) {
        if (composited)
            XShapeCombineMask(QX11Info::display(), window->winId(), ShapeBounding, 0, 0, 0L, ShapeSet);
        else
            cutX11(window, radius);
    } else if (composited) {
        window->clearMask();
    } else {
        window->setMask(region(window->rect(), radius));
    }
    return composited;
}

void roundedsurface::paint(QWidget* widget, const QColor& color, int radius, bool cut)
{
    const QRect rect = widget->rect();
    QPainter painter(widget);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    painter.setBrush(color);
    if (cut)
        painter.fillRect(rect, color);
    else
        painter.drawRoundedRect(rect, radius, radius);
    painter.setPen(color.lightness() < 128 ? QColor(255, 255, 255, 40) : QColor(0, 0, 0, 40));
    painter.setBrush(Qt::NoBrush);
    painter.drawRoundedRect(QRectF(rect).adjusted(0.5, 0.5, -0.5, -0.5), radius - 0.5, radius - 0.5);
}

// SPDX-License-Identifier: Apache-2.0
#include "roundedframe.h"

#include "windowmanagerhelper.h"

#include <KWindowEffects>
#include <QAbstractButton>
#include <QKeyEvent>
#include <QPainter>
#include <QVector>
#include <QX11Info>
#include <QtMath>

#include <cmath>
#include <xcb/shape.h>

namespace
{

/// The pixels of a rectangle that lie inside its rounded corners.
QRegion roundedRegion(const QRect& rect, int radius)
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

/// Cuts off a window's corners or gives them back. It counts in the screen's own pixels, because a widget's mask is as
/// coarse as its scale.
void setShape(const QWidget* window, int radius, bool cut)
{
    xcb_connection_t* connection = QX11Info::connection();
    if (!cut) {
        xcb_shape_mask(connection, XCB_SHAPE_SO_SET, XCB_SHAPE_SK_BOUNDING, window->winId(), 0, 0, XCB_PIXMAP_NONE);
        return;
    }
    const qreal ratio = window->devicePixelRatioF();
    const QRect pixels(0, 0, qCeil(window->width() * ratio), qCeil(window->height() * ratio));
    QVector<xcb_rectangle_t> rectangles;
    for (const QRect& part : roundedRegion(pixels, qRound(radius * ratio)))
        rectangles.append({int16_t(part.x()), int16_t(part.y()), uint16_t(part.width()), uint16_t(part.height())});
    xcb_shape_rectangles(connection, XCB_SHAPE_SO_SET, XCB_SHAPE_SK_BOUNDING, XCB_CLIP_ORDERING_UNSORTED,
                         window->winId(), 0, 0, uint32_t(rectangles.size()), rectangles.constData());
    xcb_flush(connection);
}

/// Does what a key means in a window of the toolkit. Returns whether it means anything; the window may be gone then.
bool handleKey(QWidget* window, const QKeyEvent* event)
{
    if (event->matches(QKeySequence::Cancel)) {
        window->close();
        return true;
    }
    if (event->key() != Qt::Key_Return && event->key() != Qt::Key_Enter)
        return false;
    auto* button = qobject_cast<QAbstractButton*>(window->focusWidget());
    if (button)
        button->click();
    return button;
}

} // namespace

RoundedFrame::RoundedFrame(QWidget* widget, int radius) : QObject(widget), m_widget(widget), m_radius(radius)
{
    widget->setAttribute(Qt::WA_TranslucentBackground);
    widget->installEventFilter(this);
}

void RoundedFrame::setRadius(int radius)
{
    m_radius = radius;
    updateShape();
    m_widget->update();
}

void RoundedFrame::setBlurred(bool blurred)
{
    m_blurred = blurred;
    updateBlur();
}

bool RoundedFrame::eventFilter(QObject* watched, QEvent* event)
{
    switch (event->type()) {
    case QEvent::KeyPress:
        return m_widget->isWindow() && handleKey(m_widget, static_cast<QKeyEvent*>(event));
    case QEvent::Show:
    case QEvent::Resize:
    // Changed window flags make a new native window, which knows nothing of the old one's shape and blur.
    case QEvent::WinIdChange:
        updateShape();
        break;
    case QEvent::Paint:
        // A compositing manager that starts or stops exposes the windows, so no watcher is needed.
        if (m_widget->isWindow() && m_composited != WindowManagerHelper::instance()->hasComposite())
            QMetaObject::invokeMethod(this, &RoundedFrame::updateShape, Qt::QueuedConnection);
        break;
    default:
        break;
    }
    return QObject::eventFilter(watched, event);
}

void RoundedFrame::updateShape()
{
    if (!m_widget->isWindow() || !m_widget->isVisible())
        return;
    m_composited = WindowManagerHelper::instance()->hasComposite();
    if (QX11Info::isPlatformX11())
        setShape(m_widget, m_radius, !m_composited);
    updateBlur();
}

void RoundedFrame::updateBlur()
{
    // Asking for the effect loads a plugin, so a window that never wants a blur does not ask.
    if (!m_blurred && !m_blurShown)
        return;
    if (!m_composited || !m_widget->isVisible() || !WindowManagerHelper::instance()->hasBlurWindow())
        return;
    m_blurShown = m_blurred;
    KWindowEffects::enableBlurBehind(m_widget->windowHandle(), m_blurred,
                                     m_blurred ? roundedRegion(m_widget->rect(), m_radius) : QRegion());
}

void RoundedFrame::paint(const QColor& color)
{
    const QRect rect = m_widget->rect();
    QColor fill = color;
    QPainter painter(m_widget);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    if (m_widget->isWindow() && !m_composited) {
        // Filled to the edges: half-covered pixels at the corners would have nothing to blend with.
        fill.setAlpha(255);
        painter.fillRect(rect, fill);
    } else {
        painter.setBrush(fill);
        painter.drawRoundedRect(rect, m_radius, m_radius);
    }
    painter.setPen(color.lightness() < 128 ? QColor(255, 255, 255, 40) : QColor(0, 0, 0, 40));
    painter.setBrush(Qt::NoBrush);
    painter.drawRoundedRect(QRectF(rect).adjusted(0.5, 0.5, -0.5, -0.5), m_radius - 0.5, m_radius - 0.5);
}

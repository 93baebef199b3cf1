#include "toolkitblurframe.h"

#include "themehelper.h"
#include "windowmanagerhelper.h"

#include <KWindowEffects>
#include <QPainter>
#include <QWindow>

#include <cmath>

namespace
{

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

} // namespace

ToolkitBlurFrame::ToolkitBlurFrame(QWidget* parent)
    : QWidget(parent), m_maskColor(ThemeHelper::palette(ThemeHelper::LightType).color(QPalette::Window))
{
    // A parent here means "belongs to", not "lies in", once the caller makes this a window; both must look right.
    if (!parent)
        setWindowFlags(windowFlags() | Qt::FramelessWindowHint);
    setAttribute(Qt::WA_TranslucentBackground);
    setPalette(ThemeHelper::palette(ThemeHelper::LightType));
}

void ToolkitBlurFrame::setMaskColor(const QColor& color)
{
    m_maskColor = color;
    setPalette(ThemeHelper::palette(color.lightness() < 128 ? ThemeHelper::DarkType : ThemeHelper::LightType));
    update();
}

void ToolkitBlurFrame::setMaskAlpha(int alpha)
{
    m_maskAlpha = qBound(0, alpha, 255);
    if (isVisible())
        updateBlur();
    update();
}

void ToolkitBlurFrame::setRadius(int radius)
{
    m_radius = qMax(0, radius);
    if (isVisible())
        updateShape();
    update();
}

bool ToolkitBlurFrame::event(QEvent* event)
{
    const bool handled = QWidget::event(event);
    // Changed window flags make a new native window, which knows nothing of the blur asked for on the old one.
    if (event->type() == QEvent::Show || (event->type() == QEvent::WinIdChange && isVisible()))
        updateShape();
    return handled;
}

void ToolkitBlurFrame::resizeEvent(QResizeEvent* event)
{
    QWidget::resizeEvent(event);
    if (isVisible())
        updateShape();
}

void ToolkitBlurFrame::updateShape()
{
    if (!isWindow())
        return;
    m_composited = WindowManagerHelper::instance()->hasComposite();
    if (m_composited)
        clearMask();
    else
        setMask(roundedRegion(rect(), m_radius));
    updateBlur();
}

void ToolkitBlurFrame::updateBlur()
{
    if (!isWindow() || !m_composited || !windowHandle())
        return;
    if (!WindowManagerHelper::instance()->hasBlurWindow())
        return;
    const bool wanted = m_maskAlpha < 255;
    KWindowEffects::enableBlurBehind(windowHandle(), wanted, wanted ? roundedRegion(rect(), m_radius) : QRegion());
}

void ToolkitBlurFrame::paintEvent(QPaintEvent*)
{
    // A compositing manager that starts or stops exposes the windows: the place to notice it without a watcher.
    if (isWindow() && m_composited != WindowManagerHelper::instance()->hasComposite())
        QMetaObject::invokeMethod(this, &ToolkitBlurFrame::updateShape, Qt::QueuedConnection);

    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    QColor fill = m_maskColor;
    fill.setAlpha(isWindow() && !m_composited ? 255 : m_maskAlpha);
    painter.setPen(Qt::NoPen);
    painter.setBrush(fill);
    // Cut to shape, nothing lies behind the corners that half-covered pixels could blend with.
    if (isWindow() && !m_composited)
        painter.fillRect(rect(), fill);
    else
        painter.drawRoundedRect(rect(), m_radius, m_radius);
    painter.setPen(m_maskColor.lightness() < 128 ? QColor(255, 255, 255, 40) : QColor(0, 0, 0, 40));
    painter.setBrush(Qt::NoBrush);
    painter.drawRoundedRect(QRectF(rect()).adjusted(0.5, 0.5, -0.5, -0.5), m_radius - 0.5, m_radius - 0.5);
}

#include "toolkitblurframe.h"

#include "roundedsurface.h"
#include "themehelper.h"
#include "windowkeys.h"
#include "windowmanagerhelper.h"

#include <KWindowEffects>
#include <QAccessibleWidget>
#include <QKeyEvent>
#include <QWindow>

namespace
{

/// Makes a frame that is a window one to assistive programs too, which would take it for a mere container.
QAccessibleInterface* windowInterface(const QString& className, QObject* object)
{
    auto* widget = qobject_cast<ToolkitBlurFrame*>(object);
    if (!widget || !widget->isWindow() || className != QLatin1String(ToolkitBlurFrame::staticMetaObject.className()))
        return nullptr;
    return new QAccessibleWidget(widget, QAccessible::Window);
}

} // namespace

ToolkitBlurFrame::ToolkitBlurFrame(QWidget* parent)
    : QWidget(parent), m_maskColor(ThemeHelper::palette(ThemeHelper::LightType).color(QPalette::Window))
{
    QAccessible::installFactory(windowInterface);
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

void ToolkitBlurFrame::keyPressEvent(QKeyEvent* event)
{
    if (!isWindow() || !windowkeys::handle(this, event))
        QWidget::keyPressEvent(event);
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
    m_composited = roundedsurface::applyShape(this, m_radius);
    updateBlur();
}

void ToolkitBlurFrame::updateBlur()
{
    if (!isWindow() || !m_composited || !windowHandle())
        return;
    if (!WindowManagerHelper::instance()->hasBlurWindow())
        return;
    const bool wanted = m_maskAlpha < 255;
    KWindowEffects::enableBlurBehind(windowHandle(), wanted,
                                     wanted ? roundedsurface::region(rect(), m_radius) : QRegion());
}

void ToolkitBlurFrame::paintEvent(QPaintEvent*)
{
    // A compositing manager that starts or stops exposes the windows: the place to notice it without a watcher.
    if (isWindow() && m_composited != WindowManagerHelper::instance()->hasComposite())
        QMetaObject::invokeMethod(this, &ToolkitBlurFrame::updateShape, Qt::QueuedConnection);

    const bool cut = isWindow() && !m_composited;
    QColor fill = m_maskColor;
    fill.setAlpha(cut ? 255 : m_maskAlpha);
    roundedsurface::paint(this, fill, m_radius, cut);
}

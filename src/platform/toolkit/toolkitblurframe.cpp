// SPDX-License-Identifier: Apache-2.0
#include "toolkitblurframe.h"

#include "roundedframe.h"
#include "themehelper.h"

#include <QAccessibleWidget>

namespace
{

constexpr int kFirstRadius = 12;

/// Makes a frame that is a window a window to assistive programs too: they would take it for a container.
QAccessibleInterface* windowInterface(const QString&, QObject* object)
{
    auto* widget = qobject_cast<ToolkitBlurFrame*>(object);
    return widget && widget->isWindow() ? new QAccessibleWidget(widget, QAccessible::Window) : nullptr;
}

} // namespace

ToolkitBlurFrame::ToolkitBlurFrame(QWidget* parent)
    : QWidget(parent), m_frame(new RoundedFrame(this, kFirstRadius)),
      m_maskColor(ThemeHelper::palette(ThemeHelper::LightType).color(QPalette::Window))
{
    QAccessible::installFactory(windowInterface);
    // A frame with a parent is a panel in it until the caller makes it a window. Both must look right.
    if (!parent)
        setWindowFlags(windowFlags() | Qt::FramelessWindowHint);
    m_frame->setBlurred(true);
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
    m_frame->setBlurred(m_maskAlpha < 255);
    update();
}

int ToolkitBlurFrame::radius() const
{
    return m_frame->radius();
}

void ToolkitBlurFrame::setRadius(int radius)
{
    m_frame->setRadius(qMax(0, radius));
}

void ToolkitBlurFrame::paintEvent(QPaintEvent*)
{
    QColor fill = m_maskColor;
    fill.setAlpha(m_maskAlpha);
    m_frame->paint(fill);
}

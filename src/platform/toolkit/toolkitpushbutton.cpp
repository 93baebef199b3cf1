// SPDX-License-Identifier: Apache-2.0
#include "toolkitpushbutton.h"

#include "focusring.h"

#include <QPainter>

namespace
{

constexpr qreal kCornerRadius = 8;
constexpr int kTextMargin = 16;
constexpr int kSmallestWidth = 80;
constexpr int kUsualHeight = 36;

QColor withAlpha(QColor color, int alpha)
{
    color.setAlpha(alpha);
    return color;
}

} // namespace

ToolkitPushButton::ToolkitPushButton(QWidget* parent) : ToolkitPushButton(QColor(), QString(), parent)
{
}

ToolkitPushButton::ToolkitPushButton(const QString& text, QWidget* parent) : ToolkitPushButton(QColor(), text, parent)
{
}

ToolkitPushButton::ToolkitPushButton(const QColor& accent, const QString& text, QWidget* parent)
    : QPushButton(text, parent), m_accent(accent)
{
    setAttribute(Qt::WA_Hover);
}

QSize ToolkitPushButton::sizeHint() const
{
    const QSize text = fontMetrics().size(Qt::TextHideMnemonic, this->text());
    return {qMax(kSmallestWidth, text.width() + 2 * kTextMargin), qMax(kUsualHeight, text.height() + 12)};
}

QSize ToolkitPushButton::minimumSizeHint() const
{
    return {0, fontMetrics().height() + 4};
}

QColor ToolkitPushButton::fillColor() const
{
    // Hovered and pressed accents are darker, so that the white text stays legible.
    if (isEnabled() && m_accent.isValid())
        return isDown() ? m_accent.darker(130) : underMouse() ? m_accent.darker(112) : m_accent;
    return palette().color(QPalette::Button);
}

QColor ToolkitPushButton::textColor() const
{
    if (!isEnabled())
        return palette().color(QPalette::Disabled, QPalette::ButtonText);
    return m_accent.isValid() ? QColor(Qt::white) : palette().color(QPalette::ButtonText);
}

void ToolkitPushButton::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    const QRectF plate = QRectF(rect()).adjusted(0.5, 0.5, -0.5, -0.5);
    const bool accented = isEnabled() && m_accent.isValid();
    const QColor ink = palette().color(QPalette::WindowText);
    painter.setPen(accented ? QPen(Qt::NoPen) : QPen(withAlpha(ink, isEnabled() && underMouse() ? 70 : 44), 1));
    painter.setBrush(fillColor());
    painter.drawRoundedRect(plate, kCornerRadius, kCornerRadius);
    if (!accented && isEnabled() && (isDown() || underMouse())) {
        painter.setPen(Qt::NoPen);
        painter.setBrush(withAlpha(ink, isDown() ? 36 : 14));
        painter.drawRoundedRect(plate, kCornerRadius, kCornerRadius);
    }
    // On an accent the ring is white and lies inside the edge, where it stands out.
    if (accented)
        focusring::paint(painter, this, rect().adjusted(2, 2, -2, -2), kCornerRadius - 2, Qt::white);
    else
        focusring::paint(painter, this, rect(), kCornerRadius);
    painter.setPen(textColor());
    const int room = qMax(0, width() - 8);
    const QString shown = fontMetrics().elidedText(text(), Qt::ElideRight, room, Qt::TextHideMnemonic);
    painter.drawText(rect(), Qt::AlignCenter | Qt::TextHideMnemonic, shown);
}

// SPDX-License-Identifier: Apache-2.0
#include "toolkittoolbutton.h"

#include "focusring.h"

#include <QPainter>
#include <QWindow>

namespace
{

/// Room between the text and the focus ring or the button's edge.
constexpr int kTextMargin = 5;

} // namespace

ToolkitToolButton::ToolkitToolButton(QWidget* parent) : QToolButton(parent)
{
    setAutoRaise(true);
    setFocusPolicy(Qt::StrongFocus);
    setAttribute(Qt::WA_Hover);
    setCursor(Qt::PointingHandCursor);
}

void ToolkitToolButton::setTextAlignment(Qt::Alignment alignment)
{
    m_alignment = alignment & Qt::AlignHorizontal_Mask;
    update();
}

void ToolkitToolButton::setIconTinted(bool tinted)
{
    m_iconTinted = tinted;
    update();
}

void ToolkitToolButton::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    const bool hovered = isEnabled() && underMouse();
    QColor color = palette().color(isEnabled() ? QPalette::Active : QPalette::Disabled, QPalette::ButtonText);
    if (isDown())
        color = color.darker(130);

    const int textFlags = static_cast<int>(m_alignment | Qt::AlignVCenter) | Qt::TextShowMnemonic;
    const QRect textArea = rect().adjusted(kTextMargin, 0, -kTextMargin, 0);
    QRectF ring = rect();
    if (!icon().isNull()) {
        if (hovered || isDown()) {
            QColor highlight = palette().color(QPalette::WindowText);
            highlight.setAlpha(isDown() ? 36 : 18);
            painter.setPen(Qt::NoPen);
            painter.setBrush(highlight);
            painter.drawRoundedRect(rect(), 6, 6);
        }
        QRect iconRect(QPoint(), iconSize());
        iconRect.moveCenter(rect().center());
        const QIcon::Mode mode = isEnabled() ? QIcon::Normal : QIcon::Disabled;
        if (m_iconTinted) {
            QPixmap shape = icon().pixmap(window()->windowHandle(), iconSize(), mode);
            QColor ink = palette().color(QPalette::Text);
            ink.setAlpha(hovered || isDown() ? 230 : 170);
            QPainter dye(&shape);
            dye.setCompositionMode(QPainter::CompositionMode_SourceIn);
            dye.fillRect(QRect(QPoint(), iconSize()), ink);
            dye.end();
            painter.drawPixmap(iconRect.topLeft(), shape);
        } else {
            icon().paint(&painter, iconRect, Qt::AlignCenter, mode);
        }
    } else {
        QFont textFont = font();
        textFont.setUnderline(hovered);
        painter.setFont(textFont);
        painter.setPen(color);
        painter.drawText(textArea, textFlags, text());
        const QRect textRect = fontMetrics().boundingRect(textArea, textFlags, text());
        ring = textRect.adjusted(1 - kTextMargin, 0, kTextMargin - 1, 0) & rect();
    }
    focusring::paint(painter, this, ring, 5);
}

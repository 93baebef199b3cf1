// SPDX-License-Identifier: Apache-2.0
#include "toolkitcombobox.h"

#include "focusring.h"
#include "toolkitlabel.h"

#include <QAbstractItemView>
#include <QHelpEvent>
#include <QPainter>
#include <QToolTip>

namespace
{

constexpr int kTextMargin = 12;
constexpr int kArrowRoom = 30;
constexpr qreal kFrameRadius = 6;

} // namespace

ToolkitComboBox::ToolkitComboBox(QWidget* parent) : QComboBox(parent)
{
    setAttribute(Qt::WA_Hover);
}

QRect ToolkitComboBox::textRect() const
{
    return rect().adjusted(kTextMargin, 0, -kArrowRoom, 0);
}

void ToolkitComboBox::showPopup()
{
    // The list is a window of its own, which inherits no colours from this widget. Every colour has to be set.
    QPalette colors = palette();
    for (int role = 0; role < QPalette::NColorRoles; ++role) {
        for (const QPalette::ColorGroup group : {QPalette::Active, QPalette::Inactive, QPalette::Disabled})
            colors.setBrush(group, QPalette::ColorRole(role), colors.brush(group, QPalette::ColorRole(role)));
    }
    view()->setPalette(colors);
    QComboBox::showPopup();
}

bool ToolkitComboBox::event(QEvent* event)
{
    if (event->type() == QEvent::ToolTip && toolTip().isEmpty() &&
        fontMetrics().horizontalAdvance(currentText()) > textRect().width()) {
        QToolTip::showText(static_cast<QHelpEvent*>(event)->globalPos(), ToolkitLabel::plainToolTip(currentText()),
                           this);
        return true;
    }
    return QComboBox::event(event);
}

void ToolkitComboBox::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    QColor ink = palette().color(QPalette::Text);
    QColor edge = ink;
    edge.setAlpha(isEnabled() && underMouse() ? 90 : 50);
    painter.setPen(QPen(edge, 1));
    painter.setBrush(palette().color(QPalette::Base));
    painter.drawRoundedRect(QRectF(rect()).adjusted(0.5, 0.5, -0.5, -0.5), kFrameRadius, kFrameRadius);
    focusring::paint(painter, this, rect(), kFrameRadius);

    painter.setPen(ink);
    painter.drawText(textRect(), Qt::AlignLeft | Qt::AlignVCenter,
                     fontMetrics().elidedText(currentText(), Qt::ElideRight, textRect().width()));

    ink.setAlpha(150);
    painter.setPen(QPen(ink, 1.5, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
    painter.translate(width() - kArrowRoom / 2.0, height() / 2.0);
    painter.drawPolyline(QPolygonF({QPointF(-4, -2), QPointF(0, 2), QPointF(4, -2)}));
}

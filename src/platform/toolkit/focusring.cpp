// SPDX-License-Identifier: Apache-2.0
#include "focusring.h"

#include <QPainter>
#include <QWidget>

void focusring::paint(QPainter& painter, const QWidget* widget, const QRectF& area, qreal radius, const QColor& color)
{
    if (!widget->hasFocus() || !widget->window()->testAttribute(Qt::WA_KeyboardFocusChange))
        return;
    painter.setPen(QPen(color.isValid() ? color : widget->palette().color(QPalette::Link), 2));
    painter.setBrush(Qt::NoBrush);
    painter.drawRoundedRect(area.adjusted(1, 1, -1, -1), radius - 1, radius - 1);
}

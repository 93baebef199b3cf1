// SPDX-License-Identifier: Apache-2.0
#include "toolkitframe.h"

#include <QPainter>

ToolkitFrame::ToolkitFrame(QWidget* parent) : QFrame(parent)
{
}

void ToolkitFrame::paintEvent(QPaintEvent* event)
{
    if (frameShape() != QFrame::HLine && frameShape() != QFrame::VLine)
        return QFrame::paintEvent(event);
    constexpr int kLineAlpha = 40;
    QColor color = palette().color(QPalette::WindowText);
    color.setAlpha(kLineAlpha);
    QPainter(this).fillRect(rect(), color);
}

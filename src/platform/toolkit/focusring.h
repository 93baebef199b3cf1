// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QColor>

class QPainter;
class QRectF;
class QWidget;

/** The ring that shows which widget has the keyboard focus. */
namespace focusring
{

/// Draws the ring along the inside of @p area if @p widget has the focus and the user moves the focus by key. Its
/// colour is that of the palette's links unless @p color is valid.
void paint(QPainter& painter, const QWidget* widget, const QRectF& area, qreal radius, const QColor& color = {});

} // namespace focusring

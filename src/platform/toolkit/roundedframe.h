// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>

class QColor;
class QWidget;

/**
 * The rounded, frameless surface that the toolkit's windows and panels share. It follows the events of the widget.
 *
 * Under a compositing manager a window is translucent with smooth corners; without one its corners are cut off.
 * In a window Esc closes it, and Return presses the button that has the focus.
 */
class RoundedFrame : public QObject
{
public:
    RoundedFrame(QWidget* widget, int radius);

    int radius() const { return m_radius; }
    void setRadius(int radius);

    /// Whether the window manager blurs what lies behind the window, if it can. It does not at first.
    void setBlurred(bool blurred);

    /// Paints the surface and its hairline border over the whole widget; for the widget's paintEvent().
    void paint(const QColor& color);

protected:
    bool eventFilter(QObject* watched, QEvent* event) override;

private:
    void updateShape();
    void updateBlur();

    QWidget* m_widget;
    int m_radius;
    bool m_blurred = false;
    bool m_blurShown = false;
    bool m_composited = false;
};

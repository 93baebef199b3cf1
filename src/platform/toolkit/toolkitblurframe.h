// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QColor>
#include <QWidget>

class RoundedFrame;

/**
 * A rounded, frameless surface that lets a blurred desktop shine through where the window manager can do that.
 *
 * As a window it is opaque and cut to shape without a compositing manager. Esc closes it, and Return presses the button
 * that has the focus. As a child it is a rounded panel. Its children get a palette that suits the mask colour, whatever
 * the desktop's theme.
 */
class ToolkitBlurFrame : public QWidget
{
    Q_OBJECT

public:
    explicit ToolkitBlurFrame(QWidget* parent = nullptr);

    /// The colour laid over the blurred background; its own alpha is ignored. Light grey at first.
    QColor maskColor() const { return m_maskColor; }
    void setMaskColor(const QColor& color);

    /// The opacity of the mask, 0 (clear) to 255 (opaque); values outside are clamped. 230 at first.
    int maskAlpha() const { return m_maskAlpha; }
    void setMaskAlpha(int alpha);

    /// The corner radius in pixels. 12 at first.
    int radius() const;
    void setRadius(int radius);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    RoundedFrame* m_frame;
    QColor m_maskColor;
    int m_maskAlpha = 230;
};

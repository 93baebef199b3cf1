// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QLabel>

/**
 * A label that shows its text literally, never as mark-up. A text too wide for the label fades out at its end. Pointing
 * at the label then shows all of it, unless a tool tip is set.
 */
class ToolkitLabel : public QLabel
{
    Q_OBJECT

public:
    explicit ToolkitLabel(QWidget* parent = nullptr);
    explicit ToolkitLabel(const QString& text, QWidget* parent = nullptr);

    /// The string that makes a tool tip read exactly as @p text, even if @p text looks like mark-up.
    static QString plainToolTip(const QString& text);

    /// Makes the font smaller until the text fits the label's width, in whole pixels and not below 8. A hidden label
    /// does so when it is shown.
    void shrinkFontToWidth();

    /// The y coordinate of a single line's baseline. Where the label is lower than the font's line, the line is
    /// raised so that descenders are not cut off.
    int baseline() const;

protected:
    bool event(QEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    void shrinkNow();
    bool overflows() const;
    void drawLine(QPainter& painter) const;

    bool m_shrinkWhenShown = false;
};

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QPushButton>

/**
 * A rounded push button that looks the same in every desktop style. Hover, press, focus and disabling are visible. This
 * one is quiet; its text has the palette's button-text colour, or that of a style sheet.
 */
class ToolkitPushButton : public QPushButton
{
    Q_OBJECT

public:
    explicit ToolkitPushButton(QWidget* parent = nullptr);
    explicit ToolkitPushButton(const QString& text, QWidget* parent = nullptr);

    QSize sizeHint() const override;
    QSize minimumSizeHint() const override;

protected:
    /// A button filled with @p accent, on which white text must be legible.
    ToolkitPushButton(const QColor& accent, const QString& text, QWidget* parent);

    void paintEvent(QPaintEvent* event) override;

private:
    QColor fillColor() const;
    QColor textColor() const;

    /// Invalid for a quiet button.
    QColor m_accent;
};

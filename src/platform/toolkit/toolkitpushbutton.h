#pragma once

#include <QPushButton>

/**
 * A push button in the toolkit's own look, whatever the desktop's style: rounded, with visible hover, pressed,
 * disabled and keyboard-focus states. This one is quiet; its text has the palette's button-text colour, or the one
 * that a style sheet sets.
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

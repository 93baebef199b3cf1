#pragma once

#include <QToolButton>

/**
 * A flat tool button without a frame: text in the palette's button-text colour, underlined under the pointer like a
 * link, with a visible ring when it has the keyboard focus. An icon, if set, is drawn centred on a quiet highlight.
 */
class ToolkitToolButton : public QToolButton
{
    Q_OBJECT

public:
    explicit ToolkitToolButton(QWidget* parent = nullptr);

    /// Where the text lies in the button: Qt::AlignLeft, Qt::AlignHCenter (at first) or Qt::AlignRight.
    void setTextAlignment(Qt::Alignment alignment);

    /// Whether the icon is only a shape, drawn in the palette's text colour whatever its own (not so at first).
    void setIconTinted(bool tinted);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    Qt::Alignment m_alignment = Qt::AlignHCenter;
    bool m_iconTinted = false;
};

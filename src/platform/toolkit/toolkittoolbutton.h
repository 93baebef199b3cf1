// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QToolButton>

/**
 * A flat tool button without a frame. Its text has the palette's button-text colour and is underlined under the
 * pointer, like a link. An icon, if set, is drawn centred on a quiet highlight.
 */
class ToolkitToolButton : public QToolButton
{
    Q_OBJECT

public:
    explicit ToolkitToolButton(QWidget* parent = nullptr);

    /// Where the text lies in the button: Qt::AlignLeft, Qt::AlignHCenter (at first) or Qt::AlignRight.
    void setTextAlignment(Qt::Alignment alignment);

    /// Whether the icon is drawn in the palette's text colour instead of its own. It is not at first.
    void setIconTinted(bool tinted);

protected:
    void paintEvent(QPaintEvent* event) override;

private:
    Qt::Alignment m_alignment = Qt::AlignHCenter;
    bool m_iconTinted = false;
};

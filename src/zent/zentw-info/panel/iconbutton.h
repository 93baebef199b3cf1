// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QPushButton>

class QLabel;

/** A push button made of an icon and a text beside it. */
class IconButton : public QPushButton
{
    Q_OBJECT

public:
    explicit IconButton(QWidget* parent);

    /// Fills the icon area with the image at @p path (a file or resource path).
    void setIconImg(const QString& path);

    /// Sets the text beside the icon; shown literally.
    void setText(const QString& text);

    QSize sizeHint() const override;
    QSize minimumSizeHint() const override;

private:
    QLabel* m_icon;
    QLabel* m_text;
};

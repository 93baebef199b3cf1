// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QComboBox>

/**
 * A combo box with the toolkit's quiet frame. It elides a current text that is too long; its tool tip shows all of it.
 */
class ToolkitComboBox : public QComboBox
{
    Q_OBJECT

public:
    explicit ToolkitComboBox(QWidget* parent = nullptr);
    void showPopup() override;

protected:
    bool event(QEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    QRect textRect() const;
};

#pragma once

#include <QComboBox>

/**
 * A combo box with the toolkit's quiet frame. A current text too long for it is shown elided, and whole as the
 * combo box's tool tip.
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

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QFrame>

/** A frame whose separator lines (shapes HLine and VLine) are quiet on light and on dark surfaces. */
class ToolkitFrame : public QFrame
{
    Q_OBJECT

public:
    explicit ToolkitFrame(QWidget* parent = nullptr);

protected:
    void paintEvent(QPaintEvent* event) override;
};

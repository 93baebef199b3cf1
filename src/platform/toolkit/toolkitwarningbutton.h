// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitpushbutton.h"

/** The button for what cannot be taken back: white on red. */
class ToolkitWarningButton : public ToolkitPushButton
{
    Q_OBJECT

public:
    explicit ToolkitWarningButton(QWidget* parent = nullptr);
    explicit ToolkitWarningButton(const QString& text, QWidget* parent = nullptr);
};

// SPDX-License-Identifier: Apache-2.0
#include "toolkitwarningbutton.h"

ToolkitWarningButton::ToolkitWarningButton(QWidget* parent) : ToolkitWarningButton(QString(), parent)
{
}

ToolkitWarningButton::ToolkitWarningButton(const QString& text, QWidget* parent)
    : ToolkitPushButton(QColor(0xc6, 0x28, 0x28), text, parent)
{
}

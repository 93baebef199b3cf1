// SPDX-License-Identifier: Apache-2.0
#include "toolkitsuggestbutton.h"

ToolkitSuggestButton::ToolkitSuggestButton(QWidget* parent) : ToolkitSuggestButton(QString(), parent)
{
}

ToolkitSuggestButton::ToolkitSuggestButton(const QString& text, QWidget* parent)
    : ToolkitPushButton(QColor(0x00, 0x67, 0xd6), text, parent)
{
}

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitpushbutton.h"

/** The button for what the user most likely wants: white on blue. */
class ToolkitSuggestButton : public ToolkitPushButton
{
    Q_OBJECT

public:
    explicit ToolkitSuggestButton(QWidget* parent = nullptr);
    explicit ToolkitSuggestButton(const QString& text, QWidget* parent = nullptr);
};

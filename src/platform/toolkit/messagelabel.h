// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitlabel.h"

/** The message of a dialog. It is wrapped, cut after 20 lines, and selectable; what is copied has no added breaks. */
class MessageLabel : public ToolkitLabel
{
    Q_OBJECT

public:
    explicit MessageLabel(QWidget* parent = nullptr);

    /// Shows the message; an empty one hides the label.
    void setMessage(const QString& message);
    QString message() const { return m_message; }

protected:
    void changeEvent(QEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;

private:
    void updateSize();
    void copy() const;

    QString m_message;
};

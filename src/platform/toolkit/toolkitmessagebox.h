#pragma once

#include <QMessageBox>

/** The desktop's message box with a text shown literally; it follows the desktop's light or dark theme. */
class ToolkitMessageBox : public QMessageBox
{
    Q_OBJECT

public:
    /// A box with an OK button.
    ToolkitMessageBox(Icon icon, const QString& title, const QString& text, QWidget* parent = nullptr);
};

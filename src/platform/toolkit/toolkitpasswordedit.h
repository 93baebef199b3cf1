// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitlineedit.h"

#include <QIcon>

class QAbstractButton;
class ToolkitToolButton;

/**
 * A line edit for a password. A button inside it, or Ctrl+R, reveals the text until used again or the field disappears.
 * Hidden text cannot be copied, cut or dragged out, and assistive programs see stars. Under X11 a sign shows that Caps
 * Lock is on while the field has the focus.
 */
class ToolkitPasswordEdit : public ToolkitLineEdit
{
    Q_OBJECT

public:
    explicit ToolkitPasswordEdit(QWidget* parent = nullptr);

    /// Empties the field, and forgets what undo would bring back and what of it is the desktop's selection.
    void clear();

    /// Whether the field offers its reveal button, as it does at first. Without it the text is hidden.
    void setEchoButtonVisible(bool visible);
    bool isEchoButtonVisible() const { return m_echoButtonVisible; }

    /// Shows a button with this icon while the field holds text; it empties the field. A null icon takes it away.
    void setClearIcon(const QIcon& icon);

protected:
    void focusInEvent(QFocusEvent* event) override;
    void focusOutEvent(QFocusEvent* event) override;
    void hideEvent(QHideEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void keyReleaseEvent(QKeyEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    void setRevealed(bool revealed);
    void updateCapsLock();
    void updateClearButton();
    void arrange();

    QAbstractButton* m_echoButton;
    QWidget* m_capsSign;
    ToolkitToolButton* m_clearButton;
    bool m_echoButtonVisible = true;
};

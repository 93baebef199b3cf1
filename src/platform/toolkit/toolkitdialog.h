// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "themehelper.h"

#include <QDialog>
#include <QIcon>
#include <QList>

class MessageLabel;
class QAbstractButton;
class QBoxLayout;
class RoundedFrame;
class ToolkitTitlebar;

/**
 * A rounded, frameless dialog: a title bar of 50 pixels that moves it, below it an optional message, any content, and
 * an optional row of buttons.
 *
 * Esc and the close button close it, so closeEvent() decides about both. Return presses the button that has the focus,
 * else the one made the default; no button becomes the default by itself. The dialog and its children follow the
 * desktop's light or dark theme unless setSurface() says otherwise.
 */
class ToolkitDialog : public QDialog
{
    Q_OBJECT

public:
    enum ButtonType { ButtonNormal, ButtonRecommend, ButtonWarning };
    Q_ENUM(ButtonType)

    /// The kinds of message boxes: with the button "确定", with a sign before the title as well, and without a button.
    enum BoxKind { NoticeBox, WarningBox, CriticalBox, BareBox };
    Q_ENUM(BoxKind)

    explicit ToolkitDialog(QWidget* parent = nullptr);

    /// Sets the window's icon, which the title bar shows too.
    void setIcon(const QIcon& icon);

    /// Sets the window's title, which the title bar shows too.
    void setTitle(const QString& title);

    /// The text below the title bar. It is shown literally, wrapped, selectable, and cut after 20 lines; an empty one
    /// is hidden.
    void setMessage(const QString& message);
    QString message() const;

    /// Shows a modal message box and returns when it is closed. The parent may go away meanwhile.
    static void tell(QWidget* parent, const QString& text, const QString& title = QString(), BoxKind kind = NoticeBox);

    /// Appends a button with a literal text; a default button answers to Return. Returns its index. A click emits
    /// buttonClicked(), then ends the dialog with done(index).
    int addButton(const QString& text, bool isDefault = false, ButtonType type = ButtonNormal);

    /// The buttons that addButton() made, by index.
    QList<QAbstractButton*> buttons() const { return m_buttons; }

    /// Appends a widget below the message; the dialog takes it over. Without an alignment it fills the room there is.
    void addContent(QWidget* content, Qt::Alignment alignment = {});

    /// Keeps the dialog light or dark whatever the theme; UnknownType lets it follow the theme, as it does at first.
    void setSurface(ThemeHelper::ColorType surface);

    void setVisible(bool visible) override;

signals:
    /// A button was clicked. The dialog's result alone cannot tell the first button from a closed dialog.
    void buttonClicked(int index, const QString& text);

protected:
    bool event(QEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    void updateSurface();
    void updateAccessibleTexts();
    void focusFirst();

    RoundedFrame* m_frame;
    ToolkitTitlebar* m_titlebar;
    MessageLabel* m_message;
    QBoxLayout* m_contentLayout;
    QBoxLayout* m_buttonLayout;
    QList<QAbstractButton*> m_buttons;
    ThemeHelper::ColorType m_surface = ThemeHelper::UnknownType;
};

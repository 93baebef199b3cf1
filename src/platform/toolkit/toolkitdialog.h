#pragma once

#include "themehelper.h"

#include <QDialog>
#include <QIcon>
#include <QList>

class QAbstractButton;
class QBoxLayout;
class ToolkitLabel;
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

    explicit ToolkitDialog(QWidget* parent = nullptr);

    /// Sets the window's icon, which the title bar shows too.
    void setIcon(const QIcon& icon);

    /// Sets the window's title, which the title bar shows too.
    void setTitle(const QString& title);

    /// The text below the title bar, shown literally, wrapped, and cut after some 20 lines; hidden while empty.
    void setMessage(const QString& message);
    QString message() const { return m_message; }

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
    /// A button was clicked. The dialog's result cannot tell the first button from a closed dialog; this can.
    void buttonClicked(int index, const QString& text);

protected:
    bool event(QEvent* event) override;
    void keyPressEvent(QKeyEvent* event) override;
    void paintEvent(QPaintEvent* event) override;
    void resizeEvent(QResizeEvent* event) override;

private:
    void updateSurface();
    void updateShape();
    void updateMessageSize();
    void updateAccessibleTexts();
    void focusFirst();

    ToolkitTitlebar* m_titlebar;
    ToolkitLabel* m_messageLabel;
    QBoxLayout* m_contentLayout;
    QBoxLayout* m_buttonLayout;
    QList<QAbstractButton*> m_buttons;
    QString m_message;
    ThemeHelper::ColorType m_surface = ThemeHelper::UnknownType;
    bool m_composited = false;
};

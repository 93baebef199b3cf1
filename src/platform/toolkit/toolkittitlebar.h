// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QIcon>
#include <QPoint>
#include <QWidget>

class QMenu;
class QToolButton;
class ToolkitLabel;

/**
 * The title bar of a frameless window: optional icon, title and menu, and a button that closes the window. Dragging it
 * with the left button moves the window.
 */
class ToolkitTitlebar : public QWidget
{
    Q_OBJECT

public:
    explicit ToolkitTitlebar(QWidget* parent = nullptr);

    void setIcon(const QIcon& icon);
    void setTitle(const QString& title);
    QString title() const;

    /// The menu behind the menu button; not owned. The button shows only while there is a menu and it is visible.
    void setMenu(QMenu* menu);
    void setMenuVisible(bool visible);

    /// Whether the bar leaves its background to the window below it. Otherwise it fills it with the window colour.
    void setBackgroundTransparent(bool transparent);

    /// Gives the close button the focus: for windows in which nothing else can take it.
    void focusCloseButton();

signals:
    /// The user moved the window by dragging the bar; emitted once for each drag, when it begins.
    void windowDragged();

protected:
    void mousePressEvent(QMouseEvent* event) override;
    void mouseMoveEvent(QMouseEvent* event) override;
    void mouseReleaseEvent(QMouseEvent* event) override;

private:
    void updateMenuButton();

    ToolkitLabel* m_icon;
    ToolkitLabel* m_title;
    QToolButton* m_menuButton;
    QToolButton* m_closeButton;
    bool m_menuVisible = true;
    bool m_pressed = false;
    bool m_dragging = false;
    QPoint m_pressPosition;
    QPoint m_windowPosition;
};

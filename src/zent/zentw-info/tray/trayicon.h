// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "tray/trayclicks.h"

#include <QObject>
#include <QSystemTrayIcon>

class TrayHostWatch;

/// The client's icon in the tray: made when there is a tray to show it, with its clicks told apart and its messages
/// shown beside it.
class TrayIcon : public QObject
{
    Q_OBJECT

public:
    /// Below version 1030 the icon is fixed, otherwise it follows the theme. `name` is its tool tip.
    TrayIcon(int osVersion, const QString& name, QObject* parent);

    /// Makes the icon when a tray host is there, which may be at once.
    void showWhenHosted();
    /// Makes the icon, whether or not there is a host.
    void show();
    /// Hides the icon and ends the wait for a host.
    void hide();
    /// Shows a message beside the icon. False without an icon, and in a tray that shows no balloons of its own.
    bool showBalloon(const QString& title, const QString& text);
    /// Gives the icon the form for a colour type of ThemeHelper. Nothing without an icon.
    void setSysThemetype(int colorType);

signals:
    void activated(QSystemTrayIcon::ActivationReason reason);
    /// The user asks for the message shown beside the icon.
    void balloonClicked();

private:
    void endWait();

    const int m_osVersion;
    const QString m_name;
    QSystemTrayIcon* sysTrayIcon = nullptr;
    TrayClicks trayClicks;
    /// While there is no host.
    TrayHostWatch* hostWatch = nullptr;
};

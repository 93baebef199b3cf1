// SPDX-License-Identifier: Apache-2.0
#include "tray/trayicon.h"

#include "themehelper.h"
#include "tray/sizedicon.h"
#include "tray/trayhost.h"

#include <QDebug>

namespace
{

/// Desktops from this version on have a tray icon that follows the theme.
constexpr int kThemedTrayVersion = 1030;

} // namespace

TrayIcon::TrayIcon(int osVersion, const QString& name, QObject* parent)
    : QObject(parent), m_osVersion(osVersion), m_name(name)
{
}

void TrayIcon::showWhenHosted()
{
    // Qt decides at its first tray call, for the whole process, whether there is a host of the newer kind. An icon made
    // earlier would never appear there.
    if (zent::trayhost::canShowIconNow())
        return show();
    hostWatch = new TrayHostWatch(this);
    connect(hostWatch, &TrayHostWatch::hostAppeared, this, &TrayIcon::show);
}

void TrayIcon::endWait()
{
    if (!hostWatch)
        return;
    // Later: it may be the one that calls.
    hostWatch->disconnect(this);
    hostWatch->deleteLater();
    hostWatch = nullptr;
}

void TrayIcon::show()
{
    endWait();
    sysTrayIcon = new QSystemTrayIcon(this);
    if (m_osVersion < kThemedTrayVersion)
        sysTrayIcon->setIcon(zent::sizedIcon(QStringLiteral(":/images/finalogo.svg")));
    else
        connect(ThemeHelper::instance(), &ThemeHelper::themeTypeChanged, this, &TrayIcon::setSysThemetype);
    sysTrayIcon->setToolTip(m_name);
    // Hosts of the newer kind report the two clicks of a double click singly.
    connect(sysTrayIcon, &QSystemTrayIcon::activated, this, [this](QSystemTrayIcon::ActivationReason reason) {
        trayClicks.pass(*sysTrayIcon, reason, [this](auto meant) { emit activated(meant); });
    });
    connect(sysTrayIcon, &QSystemTrayIcon::messageClicked, this, &TrayIcon::balloonClicked);
    qDebug() << "showSystemTrayIcon sysTrayIcon->show()";
    sysTrayIcon->show();
}

void TrayIcon::hide()
{
    endWait();
    if (sysTrayIcon)
        sysTrayIcon->setVisible(false);
}

bool TrayIcon::showBalloon(const QString& title, const QString& text)
{
    // Only an icon in a tray of the X display knows its place; other trays hand a balloon to the notification service.
    if (!sysTrayIcon || sysTrayIcon->geometry().isEmpty())
        return false;
    sysTrayIcon->showMessage(title, text);
    return true;
}

void TrayIcon::setSysThemetype(int colorType)
{
    if (!sysTrayIcon)
        return;
    const bool dark = colorType == ThemeHelper::DarkType;
    sysTrayIcon->setIcon(
        zent::sizedIcon(dark ? QStringLiteral(":/images/tarn_dark.svg") : QStringLiteral(":/images/tarn.svg")));
}

// The tray icon, and how clicks on it show and hide the panel.

#include "mainwindow.h"

#include "themehelper.h"

#include <QDebug>
#include <QIcon>

namespace
{

/// Desktops from this version on have their own message window and a tray icon that follows the theme.
constexpr int kThemedTrayVersion = 1030;

const char* textOf(bool value)
{
    return value ? "true" : "false";
}

} // namespace

void MainWindow::showSystemTrayIcon()
{
    sysTrayIcon = new QSystemTrayIcon(this);
    if (osVersion < kThemedTrayVersion)
        sysTrayIcon->setIcon(QIcon(QStringLiteral(":/images/finalogo.svg")));
    else
        connect(ThemeHelper::instance(), &ThemeHelper::themeTypeChanged, this, &MainWindow::setSysThemetype);
    sysTrayIcon->setToolTip(productName());
    connect(sysTrayIcon, &QSystemTrayIcon::activated, this, [this](QSystemTrayIcon::ActivationReason reason) {
        trayClicks.pass(*sysTrayIcon, reason, [this](auto meant) { onActivatedSysTrayIcon(meant); });
    });
    qDebug() << "showSystemTrayIcon"
             << "sysTrayIcon->show()";
    sysTrayIcon->show();
}

bool MainWindow::showTrayBalloon(const QString& title, const QString& text)
{
    if (!sysTrayIcon)
        return false;
    connect(sysTrayIcon, &QSystemTrayIcon::messageClicked, this, &MainWindow::openNotice, Qt::UniqueConnection);
    sysTrayIcon->showMessage(title, text);
    return true;
}

void MainWindow::setSysThemetype(int colorType)
{
    const bool dark = colorType == ThemeHelper::DarkType;
    sysTrayIcon->setIcon(QIcon(dark ? QStringLiteral(":/images/tarn_dark.svg") : QStringLiteral(":/images/tarn.svg")));
}

void MainWindow::onActivatedSysTrayIcon(QSystemTrayIcon::ActivationReason reason)
{
    qDebug() << "onActivatedSysTrayIcon"
             << "reason :" << static_cast<int>(reason);
    switch (reason) {
    case QSystemTrayIcon::Context:
        // The next left click shows the panel, whether it is visible or not.
        winstatus = 1;
        break;
    case QSystemTrayIcon::Trigger:
        qDebug() << "tarn ishidden : " << textOf(isHidden());
        qDebug() << "tarn this->openMessagetWindow : " << textOf(openMessagetWindow);
        dealSysTrayEvent();
        break;
    case QSystemTrayIcon::DoubleClick:
    case QSystemTrayIcon::MiddleClick:
    case QSystemTrayIcon::Unknown:
        break;
    }
}

void MainWindow::dealSysTrayEvent()
{
    if (osVersion >= kThemedTrayVersion) {
        toggleMessageWindow();
        return;
    }
    qDebug() << "winstatus : " << winstatus;
    if (winstatus == 0) {
        onHideClicked();
        return;
    }
    activateWindow();
    show();
    repaint();
    winstatus = 0;
    setFocus(Qt::OtherFocusReason);
}

void MainWindow::toggleMessageWindow()
{
    const bool show = !openMessagetWindow || (messageWindow && messageWindow->isHidden());
    if (!openMessagetWindow)
        qDebug() << "tarn this->openMessagetWindow @@@@: " << textOf(openMessagetWindow);
    if (messageWindow)
        messageWindow->setVisible(show);
}

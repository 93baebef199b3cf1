// SPDX-License-Identifier: Apache-2.0
// What the window shows and opens: its two pages, and the dialogs behind its links and messages.

#include "mainwindow/mainwindow.h"

#include "activeconnections.h"
#include "messages/noticedialog.h"
#include "messages/notification.h"
#include "networkdaemonproxy.h"
#include "panel/infowidget.h"
#include "panel/records.h"
#include "password/modifydialog.h"
#include "release/closeguarddialog.h"
#include "screen/screens.h"
#include "toolkitdialog.h"

#include <QDebug>
#include <QPointer>
#include <QPushButton>

#include <utility>

namespace
{

void warnOfFailedRead(QWidget* parent, const QString& text)
{
    ToolkitDialog::tell(parent, text, QStringLiteral("消息调用警告"), ToolkitDialog::WarningBox);
}

} // namespace

void MainWindow::onLogininfoClicked()
{
    infoPage = kLoginPage;
    toLogininfo();
}

void MainWindow::onNetinfoClicked()
{
    infoPage = kNetworkPage;
    toNetinfo();
}

void MainWindow::updateNetInfo()
{
    pageIsDue[infoPage] = true;
    fillDuePages();
}

void MainWindow::showEvent(QShowEvent* event)
{
    ToolkitBlurFrame::showEvent(event);
    // The network daemon may have come up since a page was to be filled.
    fillDuePages();
}

void MainWindow::fillDuePages()
{
    if (!pageIsDue[kLoginPage] && !pageIsDue[kNetworkPage])
        return;
    const std::optional<QString> answer = networkProxy->activeConnectionInfo();
    const auto array = zent::parseConnectionArray(answer.value_or(QString()).toLocal8Bit());
    const auto connections = zent::primaryConnections(array.value_or(QJsonArray()));
    // Without a good answer both pages keep what they show.
    if (!array || !connections) {
        if (answer)
            qWarning() << "GetActiveConnectionInfo gave no list of connections";
        return;
    }
    if (std::exchange(pageIsDue[kLoginPage], false))
        infoWidget->setLoginInfo(account.loginInfo());
    if (!std::exchange(pageIsDue[kNetworkPage], false))
        return;
    TNetInfo info;
    info.hostName = terminal.hostName;
    info.userName = account.name();
    qDebug() << "updateNetInfo array----:" << *array;
    // A later primary connection overwrites an earlier one.
    for (const zent::ActiveConnection& connection : *connections) {
        qDebug() << "updateNetInfo array--2@@@--:" << connection.hwAddress;
        info.mac = connection.hwAddress;
        info.ipv4 = connection.address;
        info.gateway = connection.gateway;
        info.dns = connection.dns;
        info.subnetMask = connection.mask;
        info.speed = connection.speed;
    }
    infoWidget->setNetInfo(info);
}

void MainWindow::onCloseguardClicked()
{
    if (!guardDialog)
        guardDialog = new closeGuarddialog(this);
    guardDialog->setUsrname(account.name());
    guardDialog->setScencelist(scenes.count());
    zent::screens::placeCentre(*guardDialog);
    // One more connection on every call, as agreed.
    connect(guardDialog, &closeGuarddialog::closeall, this, &MainWindow::shutdown);
    guardDialog->show();
}

void MainWindow::onModifypasswordClicked()
{
    if (!modifyDialog)
        modifyDialog = new ModifyDialog(this);
    modifyDialog->setUserName(account.name(), scenes.currentCode());
    modifyDialog->setIpport(terminal.server());
    modifyDialog->setMachineId(terminal.machineId);
    modifyDialog->setUserID(account.id());
    zent::screens::placeCentre(*modifyDialog);
    modifyDialog->show();
}

void MainWindow::createNoticeDialog()
{
    if (!QNotification::qInstance)
        QNotification::qInstance = new QNotification;
    noticeDialog = new NoticeDialog(account.name(), this);
    noticeDialog->setWindowFlags(noticeDialog->windowFlags() | Qt::WindowStaysOnTopHint);
}

void MainWindow::initPlatformMessage()
{
    unread.start();
    connect(noticeDialog->firstButton(), &QPushButton::clicked, this, &MainWindow::onNoticeReadbuttonClicked);
    connect(noticeDialog->nextButton(), &QPushButton::clicked, this, &MainWindow::onNoticeNextbuttonClicked);
}

void MainWindow::onReadListMessage(const QString&)
{
    unread.readOneUnreadMessage();
    refreshOpenNotice();
}

void MainWindow::onReadAllMessage()
{
    unread.readAllUnreadMessages();
    refreshOpenNotice();
}

void MainWindow::refreshOpenNotice()
{
    if (noticeDialog->isVisible() || noticeDialog->isActiveWindow())
        noticeDialog->showNotice();
}

void MainWindow::openNotice()
{
    noticeDialog->showNotice();
}

void MainWindow::onNoticeReadbuttonClicked()
{
    if (!noticeDialog->offersRead()) {
        noticeDialog->hide();
        return;
    }
    // A second click during the request or during the dialog's wait must not send a second one.
    noticeDialog->firstButton()->blockSignals(true);
    const QString uuid = noticeDialog->currentUuid();
    QNotification::qInstance->readNotifyMessage(
        uuid, [self = QPointer<MainWindow>(this), uuid](bool ok, const QString& text) {
            if (!self)
                return;
            if (ok)
                self->noticeDialog->showNotice();
            else
                warnOfFailedRead(self->noticeDialog, text);
            if (!self)
                return;
            if (ok)
                emit self->readNotify(uuid);
            self->noticeDialog->firstButton()->blockSignals(false);
        });
}

void MainWindow::onNoticeNextbuttonClicked()
{
    // Only a successful refresh enables it again.
    noticeDialog->nextButton()->setEnabled(false);
    const QString uuid = noticeDialog->currentUuid();
    QNotification::qInstance->readNotifyMessage(
        uuid, [self = QPointer<MainWindow>(this), uuid](bool ok, const QString& text) {
            if (!self)
                return;
            if (!ok)
                return warnOfFailedRead(self->noticeDialog, text);
            emit self->readNotify(uuid);
            if (self)
                self->noticeDialog->showNotice();
        });
}

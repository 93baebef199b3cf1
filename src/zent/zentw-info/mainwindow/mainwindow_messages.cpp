// The unread-message poll, and what the notice dialog's buttons do.

#include "mainwindow.h"

#include "infowidget.h"
#include "noticedialog.h"
#include "notification.h"
#include "toolkitmessagebox.h"

#include <QPointer>
#include <QPushButton>
#include <QTimer>

int MainWindow::unreadMessageCount = 0;

namespace
{

constexpr int kFirstPollEarliestMs = 1000;
constexpr int kFirstPollLatestMs = 3000;
constexpr int kPollEarliestMs = 60000;
constexpr int kPollLatestMs = 180000;

QString unreadText(const QString& number)
{
    return QStringLiteral("未读消息(%1)").arg(number);
}

QString noneUnreadText()
{
    return QStringLiteral("全部消息");
}

void warnOfFailedRead(QWidget* parent, const QString& text)
{
    // On the heap: the parent may go away while the box is open.
    const QPointer<ToolkitMessageBox> box =
        new ToolkitMessageBox(QMessageBox::Warning, QStringLiteral("消息调用警告"), text, parent);
    box->exec();
    delete box;
}

} // namespace

void MainWindow::initPlatformMessage()
{
    unreadTimer = std::make_unique<QTimer>();
    connect(unreadTimer.get(), &QTimer::timeout, this, &MainWindow::unreadMessages);
    unreadTimer->start(generateRandnum(kFirstPollLatestMs, kFirstPollEarliestMs));
    initUnreadMessageCount();
    connect(noticeDialog->firstButton(), &QPushButton::clicked, this, &MainWindow::onNoticeReadbuttonClicked);
    connect(noticeDialog->nextButton(), &QPushButton::clicked, this, &MainWindow::onNoticeNextbuttonClicked);
    connect(this, &MainWindow::startgetMeInfo, this, &MainWindow::getusrInfo);
}

void MainWindow::askUnread(const std::function<void(int total)>& counted)
{
    QNotification::qInstance->getNotifyMessageList(
        userName, true, 1, 1,
        [self = QPointer<MainWindow>(this), counted](bool ok, const NotifyMessageResponse& response) {
            // No answer and a count of 0 both leave the text as it is.
            if (!self || !ok || response.total < 1)
                return;
            self->infoWidget->setMessageButtonText(unreadText(QNotification::formatUnReadNumber(response.total)));
            counted(response.total);
        });
}

void MainWindow::initUnreadMessageCount()
{
    askUnread([](int total) { unreadMessageCount = total; });
}

void MainWindow::unreadMessages()
{
    askUnread([this](int total) {
        if (total == unreadMessageCount)
            return;
        unreadMessageCount = total;
        emit newMessage();
    });
    unreadTimer->stop();
    unreadTimer->start(generateRandnum(kPollLatestMs, kPollEarliestMs));
}

void MainWindow::readOneUnreadMessage()
{
    unreadMessageCount = std::max(unreadMessageCount - 1, 0);
    infoWidget->setMessageButtonText(unreadMessageCount > 0 ? unreadText(QString::number(unreadMessageCount))
                                                            : noneUnreadText());
}

void MainWindow::onReadListMessage(const QString&)
{
    readOneUnreadMessage();
    refreshOpenNotice();
}

void MainWindow::onReadAllMessage()
{
    unreadMessageCount = 0;
    infoWidget->setMessageButtonText(noneUnreadText());
    refreshOpenNotice();
}

void MainWindow::refreshOpenNotice()
{
    if (noticeDialog->isVisible() || noticeDialog->isActiveWindow())
        noticeDialog->showNotice();
}

void MainWindow::onCloseMessageWinDow()
{
    openMessagetWindow = false;
}

void MainWindow::openNotice()
{
    noticeDialog->showNotice();
}

void MainWindow::onNoticeReadbuttonClicked()
{
    if (noticeDialog->total() != 1) {
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

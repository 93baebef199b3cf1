// SPDX-License-Identifier: Apache-2.0
#include "messages/unreadpoll.h"

#include "messages/notification.h"

#include <QPointer>

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

} // namespace

UnreadPoll::UnreadPoll(const QString& userName, int& count, QObject* parent, zent::RandomInterval random)
    : QObject(parent), m_userName(userName), m_count(count), m_random(std::move(random))
{
    connect(&unreadTimer, &QTimer::timeout, this, &UnreadPoll::unreadMessages);
}

void UnreadPoll::start()
{
    unreadTimer.start(m_random(kFirstPollLatestMs, kFirstPollEarliestMs));
    initUnreadMessageCount();
}

void UnreadPoll::askUnread(const std::function<void(int total)>& counted)
{
    QNotification::qInstance->getNotifyMessageList(
        m_userName, true, 1, 1,
        [self = QPointer<UnreadPoll>(this), counted](bool ok, const NotifyMessageResponse& response) {
            // No answer and a count of 0 both leave the text as it is.
            if (!self || !ok || response.total < 1)
                return;
            emit self->textChanged(unreadText(QNotification::formatUnReadNumber(response.total)));
            counted(response.total);
        });
}

void UnreadPoll::initUnreadMessageCount()
{
    askUnread([this](int total) { m_count = total; });
}

void UnreadPoll::unreadMessages()
{
    askUnread([this](int total) {
        if (total == m_count)
            return;
        m_count = total;
        emit newMessage();
    });
    unreadTimer.start(m_random(kPollLatestMs, kPollEarliestMs));
}

void UnreadPoll::readOneUnreadMessage()
{
    m_count = std::max(m_count - 1, 0);
    emit textChanged(m_count > 0 ? unreadText(QString::number(m_count)) : noneUnreadText());
}

void UnreadPoll::readAllUnreadMessages()
{
    m_count = 0;
    emit textChanged(noneUnreadText());
}

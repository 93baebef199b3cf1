// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "system/randnum.h"

#include <QObject>
#include <QString>
#include <QTimer>

#include <functional>

/// Asks the notification service from time to time for the number of the user's unread messages, and announces changes.
class UnreadPoll : public QObject
{
    Q_OBJECT

public:
    /// Keeps the number in `count`. `userName` is looked up when it is needed; both must outlive this.
    UnreadPoll(const QString& userName, int& count, QObject* parent = nullptr,
               zent::RandomInterval random = zent::generateRandnum);

    /// Asks once without announcing the answer, and starts the poll.
    void start();

    /// Asks once, without announcing the answer.
    void initUnreadMessageCount();
    /// Takes one message, or all, off the count and off the text.
    void readOneUnreadMessage();
    void readAllUnreadMessages();

public slots:
    /// Asks, announces a change, and sets the time of the next poll.
    void unreadMessages();

signals:
    /// The number is another one than at the last poll.
    void newMessage();
    /// What the panel says of the number.
    void textChanged(const QString& text);

private:
    void askUnread(const std::function<void(int total)>& counted);

    const QString& m_userName;
    int& m_count;
    const zent::RandomInterval m_random;
    QTimer unreadTimer{this};
};

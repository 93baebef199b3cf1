// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusPendingCall>
#include <QObject>
#include <QSet>
#include <QString>
#include <QStringList>
#include <QVector>

class QDBusMessage;
class QDBusPendingCallWatcher;

/// Shows messages as notifications of the desktop (org.freedesktop.Notifications on the session bus), with an action
/// that opens them. Never waits for the service: whether it is missing, hangs or restarts is seen from its answers.
/// The service is not contacted before the first message.
class DesktopNotifier : public QObject
{
    Q_OBJECT

public:
    explicit DesktopNotifier(QObject* parent = nullptr);

    /// Shows a message; unavailable() says later when that did not work. All three are plain texts.
    void notify(const QString& title, const QString& sender, const QString& text);

    /// A message as the plain text below its title: a line naming the sender, unless that is empty, and the text.
    static QString body(const QString& sender, const QString& text);

signals:
    /// The user asks for the message of one of our notifications.
    void activated();
    /// This message was not shown: no bus, no service, an error, or no answer within 5 s.
    void unavailable(const QString& title, const QString& sender, const QString& text);

private slots:
    void onActionInvoked(uint id, const QString& action);
    void onNotificationClosed(uint id, uint reason);

private:
    struct Message {
        QString title;
        QString sender;
        QString text;
    };
    /// What is known of the running service.
    enum class Capabilities { Unknown, Asked, Known };

    void onServerChanged(const QString& oldOwner);
    void askCapabilities();
    void onCapabilities(const QDBusPendingCall& call);
    void send(const Message& message);
    void onSent(const QDBusPendingCall& call, const Message& message);
    void giveUp(const Message& message);
    /// Closes a notification that came after its message had been given up.
    void withdraw(const QDBusPendingCall& call);
    void giveUpWaiting();
    /// Calls `finished` with the answer, or with an error after 5 s, always through the event loop.
    template <typename Function>
    QDBusPendingCallWatcher* call(const QDBusMessage& question, Function finished);

    Capabilities m_capabilities = Capabilities::Unknown;
    bool m_bodyMarkup = false;
    /// Valid while the capabilities are asked for.
    QDBusPendingCallWatcher* m_capabilitiesCall = nullptr;
    /// Messages that wait for the capabilities.
    QVector<Message> m_waiting;
    /// Our notifications that may still be on show.
    QSet<uint> m_ids;
    /// Counts the services seen, to tell an answer of a former one.
    int m_server = 0;
};

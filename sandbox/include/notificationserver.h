// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDBusConnection>
#include <QDBusContext>
#include <QDBusError>
#include <QDBusMessage>
#include <QStringList>
#include <QVariantMap>

/// A notification service of the desktop, on a connection of its own.
class NotificationServer : public QObject, protected QDBusContext
{
    Q_OBJECT
    Q_CLASSINFO("D-Bus Interface", "org.freedesktop.Notifications")

public:
    static QString service() { return QStringLiteral("org.freedesktop.Notifications"); }
    static QString path() { return QStringLiteral("/org/freedesktop/Notifications"); }

    explicit NotificationServer(const QStringList& capabilities) : capabilities(capabilities)
    {
        static int number = 0;
        m_name = QString("server%1").arg(++number);
        QDBusConnection bus = QDBusConnection::connectToBus(QDBusConnection::SessionBus, m_name);
        if (!bus.registerObject(path(), this, QDBusConnection::ExportAllSlots | QDBusConnection::ExportAllSignals) ||
            !bus.registerService(service()))
            qFatal("cannot own %s", qPrintable(service()));
    }
    ~NotificationServer() override { QDBusConnection::disconnectFromBus(m_name); }

    QStringList capabilities;
    /// The question that was not answered.
    QDBusMessage late;
    void answerLate() { QDBusConnection(m_name).send(late.createReply(++lastId)); }
    /// The method that does not answer as it should, and what it does instead: "hang", "fail" or this text.
    QString failing;
    QString instead;
    int asked = 0;
    QList<QVariantList> shown;
    QList<uint> closed;
    uint lastId = 100;

public slots:
    QStringList GetCapabilities()
    {
        ++asked;
        answer("GetCapabilities");
        return capabilities;
    }
    void CloseNotification(uint id) { closed.append(id); }
    uint Notify(const QString& application, uint replaces, const QString& icon, const QString& summary,
                const QString& body, const QStringList& actions, const QVariantMap& hints, int timeout)
    {
        shown.append({application, replaces, icon, summary, body, actions, hints, timeout});
        answer("Notify");
        return ++lastId;
    }

signals:
    void ActionInvoked(uint id, const QString& action);
    void NotificationClosed(uint id, uint reason);

private:
    void answer(const QString& method)
    {
        if (failing != method)
            return;
        if (instead == "fail")
            return sendErrorReply(QDBusError::Failed, "the server says no");
        setDelayedReply(true);
        late = message();
        if (instead != "hang")
            QDBusConnection(m_name).send(message().createReply(instead));
    }

    QString m_name;
};

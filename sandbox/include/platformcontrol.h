// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDateTime>
#include <QEventLoop>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QNetworkAccessManager>
#include <QNetworkProxy>
#include <QNetworkReply>

/// The simulated platform's control interface, for tests inside a room.
class PlatformControl
{
public:
    /// It is asked directly, whatever proxy a test sets for the program.
    PlatformControl() { m_manager.setProxy(QNetworkProxy::NoProxy); }
    QJsonObject state() { return call("GET", "state").object(); }
    void patchState(const QJsonObject& patch) { call("PATCH", "state", patch); }
    void clearRecord() { call("DELETE", "record"); }
    /// The recorded requests, calls and processes of one kind ("http", "dbus", "process").
    QList<QJsonObject> record(const QString& kind)
    {
        QList<QJsonObject> entries;
        for (const QJsonValue& value : call("GET", "record").array()) {
            if (value.toObject().value("kind") == kind)
                entries.append(value.toObject());
        }
        return entries;
    }
    /// The recorded HTTP requests of one path.
    QList<QJsonObject> requests(const QString& path)
    {
        QList<QJsonObject> entries;
        for (const QJsonObject& entry : record("http")) {
            if (entry.value("path") == path)
                entries.append(entry);
        }
        return entries;
    }
    void addFault(const QJsonObject& match, const QJsonObject& action)
    {
        call("POST", "faults", {{"match", match}, {"action", action}});
    }
    void clearFaults() { call("DELETE", "faults"); }
    /// Leaves the user that many unread messages with the uuids "0", "1", ..., each a minute younger than the former.
    void setUnread(int count)
    {
        const QDateTime start(QDate(2026, 11, 24), QTime(), Qt::UTC);
        QJsonArray messages;
        for (int i = 0; i < count; ++i)
            messages.append(QJsonObject{{"uuid", QString::number(i)},
                                        {"uid", "zhangsan"},
                                        {"send_uid", QStringLiteral("<b>管理员</b>")},
                                        {"title", QStringLiteral("<i>通知</i> %1 %2").arg(i)},
                                        {"content", "text"},
                                        {"created_at", start.addSecs(60 * i).toString(Qt::ISODate)},
                                        {"read_at", ""}});
        patchState({{"messages", messages}});
    }

private:
    QJsonDocument call(const QByteArray& verb, const QString& what, const QJsonObject& body = {})
    {
        QNetworkRequest request(QUrl("http://127.0.0.1:9900/" + what));
        request.setHeader(QNetworkRequest::ContentTypeHeader, "application/json");
        QNetworkReply* reply =
            m_manager.sendCustomRequest(request, verb, body.isEmpty() ? QByteArray() : QJsonDocument(body).toJson());
        QEventLoop loop;
        QObject::connect(reply, &QNetworkReply::finished, &loop, &QEventLoop::quit);
        if (!reply->isFinished())
            loop.exec();
        if (reply->error() != QNetworkReply::NoError)
            qFatal("control interface: %s", qPrintable(reply->errorString()));
        const QJsonDocument answer = QJsonDocument::fromJson(reply->readAll());
        delete reply;
        return answer;
    }

    QNetworkAccessManager m_manager;
};

// SPDX-License-Identifier: Apache-2.0
#include "replywatch.h"

#include <QDebug>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QTimer>

#include <malloc.h>

namespace zent
{

namespace
{

const char* methodOf(const QNetworkReply* reply)
{
    return reply->operation() == QNetworkAccessManager::PutOperation ? "PUT" : "GET";
}

/// Whether the connection broke, or never came about, as opposed to an answer that tells of an error.
bool connectionFailed(const QNetworkReply* reply)
{
    return reply->error() != QNetworkReply::NoError && reply->error() < QNetworkReply::ContentAccessDenied;
}

} // namespace

bool dropConnections(QNetworkAccessManager* manager)
{
    if (!manager->findChildren<QNetworkReply*>().isEmpty())
        return false;
    manager->clearConnectionCache();
    return true;
}

void watchReply(QNetworkReply* reply, std::chrono::milliseconds time)
{
    http::limitReply(reply);
    http::limitTime(reply, time);
    QObject::connect(reply, &QNetworkReply::finished, reply, [reply] {
        if (succeeded(reply))
            return;
        qWarning() << methodOf(reply) << http::logUrl(reply->url()) << "failed:" << qPrintable(http::failureOf(reply));
        if (!connectionFailed(reply))
            return;
        // Qt would reuse the broken connection. Each new TLS session on it leaks the previous one, about 13 KiB. This
        // waits until the reply is gone, because the reply may still use the connection.
        QNetworkAccessManager* manager = reply->manager();
        QObject::connect(
            reply, &QObject::destroyed, manager, [manager] { dropConnections(manager); }, Qt::QueuedConnection);
    });
    // The C library keeps free memory that lies between blocks in use, such as the pieces of a large body. It goes back
    // to the system after each reply; polls bring one every minute or two.
    QObject::connect(reply, &QObject::destroyed, [] { QTimer::singleShot(0, [] { malloc_trim(0); }); });
}

bool succeeded(const QNetworkReply* reply)
{
    return reply->error() == QNetworkReply::NoError && http::statusOf(reply) == http::kOk;
}

} // namespace zent

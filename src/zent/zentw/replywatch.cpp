#include "replywatch.h"

#include "replylimit.h"

#include <QDebug>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QTimer>

#include <algorithm>
#include <malloc.h>

namespace zent
{

namespace
{

constexpr int kHttpOk = 200;
constexpr int kFirstErrorStatus = 400;
constexpr char kTooLarge[] = "tooLarge";

int statusOf(const QNetworkReply* reply)
{
    return reply->attribute(QNetworkRequest::HttpStatusCodeAttribute).toInt();
}

const char* methodOf(const QNetworkReply* reply)
{
    return reply->operation() == QNetworkAccessManager::PutOperation ? "PUT" : "GET";
}

QString reasonOf(const QNetworkReply* reply)
{
    if (reply->property(kTooLarge).toBool())
        return QStringLiteral("the reply is over %1 MiB").arg(http::kMaxReplyBytes >> 20);
    // The words for a status hold the whole URL.
    const bool answered = reply->error() == QNetworkReply::NoError || statusOf(reply) >= kFirstErrorStatus;
    return answered ? QStringLiteral("status %1").arg(statusOf(reply)) : reply->errorString();
}

/// Whether the connection broke, or never came about, as opposed to an answer that tells of an error.
bool connectionFailed(const QNetworkReply* reply)
{
    return reply->error() != QNetworkReply::NoError && reply->error() < QNetworkReply::ContentAccessDenied;
}

/// Has the manager forget its connections, unless one is in use. Qt otherwise goes on with the broken one, and of every
/// TLS session that it then starts on it it keeps the one before, some 13 KiB.
void dropConnections(QNetworkAccessManager* manager)
{
    // Later: the reply that failed is still being finished.
    QMetaObject::invokeMethod(
        manager,
        [manager] {
            const QList<QNetworkReply*> replies = manager->findChildren<QNetworkReply*>();
            if (std::all_of(replies.begin(), replies.end(), [](auto* reply) { return reply->isFinished(); }))
                manager->clearConnectionCache();
        },
        Qt::QueuedConnection);
}

} // namespace

void watchReply(QNetworkReply* reply)
{
    // Nobody reads before the end, so what is there is the whole body so far.
    QObject::connect(reply, &QNetworkReply::readyRead, reply, [reply] {
        if (reply->bytesAvailable() <= http::kMaxReplyBytes)
            return;
        reply->setProperty(kTooLarge, true);
        reply->abort();
    });
    QObject::connect(reply, &QNetworkReply::finished, reply, [reply] {
        if (succeeded(reply))
            return;
        qWarning() << methodOf(reply) << reply->url().toString(QUrl::RemoveQuery | QUrl::RemoveUserInfo)
                   << "failed:" << qPrintable(reasonOf(reply));
        if (connectionFailed(reply))
            dropConnections(reply->manager());
    });
    // Once a reply is done with, and a poll comes every minute or two, what lies free between blocks in use, such as
    // the pieces of a large body or a closed dialog, goes back to the system; the C library would keep it.
    QObject::connect(reply, &QObject::destroyed, [] { QTimer::singleShot(0, [] { malloc_trim(0); }); });
}

bool succeeded(const QNetworkReply* reply)
{
    return reply->error() == QNetworkReply::NoError && statusOf(reply) == kHttpOk;
}

} // namespace zent

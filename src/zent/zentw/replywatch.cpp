#include "replywatch.h"

#include "replylimit.h"

#include <QDebug>
#include <QNetworkReply>

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
    });
}

bool succeeded(const QNetworkReply* reply)
{
    return reply->error() == QNetworkReply::NoError && statusOf(reply) == kHttpOk;
}

} // namespace zent

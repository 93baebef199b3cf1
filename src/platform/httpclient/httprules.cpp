// SPDX-License-Identifier: Apache-2.0
#include "httprules.h"

#include "lookups.h"

#include <QCoreApplication>
#include <QFile>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QNetworkRequest>
#include <QSslCertificate>
#include <QSslConfiguration>
#include <QSslKey>
#include <QTimer>
#include <QUrl>

#include <algorithm>

#include <sys/stat.h>

namespace zent::http
{

namespace
{

// What is noted at a reply that a limit has ended.
constexpr char kTooLarge[] = "tooLarge";
constexpr char kTooLate[] = "tooLate";
constexpr int kFirstErrorStatus = 400;

QSslKey readKey(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly))
        return {};
    const QByteArray pem = file.readAll();
    // Qt has to be told what kind of key it is.
    for (const QSsl::KeyAlgorithm algorithm : {QSsl::Rsa, QSsl::Ec}) {
        QSslKey key(pem, algorithm);
        if (!key.isNull())
            return key;
    }
    return {};
}

QString quoted(const QString& path)
{
    return QLatin1Char('"') + path + QLatin1Char('"');
}

} // namespace

void leaveOutBearers()
{
    // Qt looks for the plugins once, with the first manager, and has no setting for it.
    const QStringList paths = QCoreApplication::libraryPaths();
    QCoreApplication::setLibraryPaths({});
    const QNetworkAccessManager first;
    QCoreApplication::setLibraryPaths(paths);
}

QByteArray fingerprint(const TlsFiles& files)
{
    QByteArray bytes;
    for (const QString& path : {files.ca, files.cert, files.key}) {
        bytes += '\0';
        struct stat status = {};
        if (path.isEmpty() || stat(QFile::encodeName(path).constData(), &status) != 0)
            continue;
        for (const auto number :
             {static_cast<qint64>(status.st_mtim.tv_sec), static_cast<qint64>(status.st_mtim.tv_nsec),
              static_cast<qint64>(status.st_size), static_cast<qint64>(status.st_ino)})
            bytes.append(reinterpret_cast<const char*>(&number), sizeof number);
    }
    return bytes;
}

QSslConfiguration tlsOfTerminal(const TlsFiles& files, QString& problem)
{
    problem.clear();
    QSslConfiguration ssl = QSslConfiguration::defaultConfiguration();
    ssl.setProtocol(QSsl::TlsV1_2OrLater);
    // Set, not added: the system's authorities are out, also when the file is missing.
    ssl.setCaCertificates(files.ca.isEmpty() ? QList<QSslCertificate>() : QSslCertificate::fromPath(files.ca));
    if (files.cert.isEmpty())
        return ssl;
    const QList<QSslCertificate> chain = QSslCertificate::fromPath(files.cert);
    const QString keyPath = files.key.isEmpty() ? files.cert : files.key;
    const QSslKey key = readKey(keyPath);
    if (chain.isEmpty())
        problem = QStringLiteral("no certificate can be read from ") + quoted(files.cert);
    else if (key.isNull())
        problem = QStringLiteral("no private key can be read from ") + quoted(keyPath);
    ssl.setLocalCertificateChain(chain);
    ssl.setPrivateKey(key);
    return ssl;
}

QSslConfiguration tlsBesideSystem(const QString& ca)
{
    QSslConfiguration ssl = QSslConfiguration::defaultConfiguration();
    ssl.setProtocol(QSsl::TlsV1_2OrLater);
    // Added, not set: a configuration whose authorities were set holds all of the system's in memory, otherwise the one
    // needed is looked up when it is needed.
    ssl.addCaCertificates(QSslCertificate::fromPath(ca));
    return ssl;
}

QNetworkRequest makeRequest(const QUrl& url)
{
    QNetworkRequest request(url);
    // Qt follows no redirect, keeps no reply and speaks HTTP/1.1 where nothing else is asked for.
    request.setAttribute(QNetworkRequest::CookieSaveControlAttribute, QNetworkRequest::Manual);
    // Qt would ask for compressed replies and inflate them without a bound. With a header of ours it does neither.
    request.setRawHeader("Accept-Encoding", "identity");
    return request;
}

void limitReply(QNetworkReply* reply)
{
    const auto check = [reply] {
        const qint64 announced = reply->header(QNetworkRequest::ContentLengthHeader).toLongLong();
        if (std::max(announced, reply->bytesAvailable()) <= kMaxReplyBytes || isTooLarge(reply))
            return;
        reply->setProperty(kTooLarge, true);
        reply->abort();
    };
    noteLookup(reply);
    // More than is allowed tells the reply that is too large. Over plain HTTP Qt stops up to 128 KiB short.
    constexpr qint64 kMargin = 256LL * 1024;
    reply->setReadBufferSize(kMaxReplyBytes + kMargin);
    QObject::connect(reply, &QNetworkReply::metaDataChanged, reply, check);
    QObject::connect(reply, &QNetworkReply::readyRead, reply, check);
}

bool isTooLarge(const QNetworkReply* reply)
{
    return reply->property(kTooLarge).toBool();
}

void limitTime(QNetworkReply* reply, std::chrono::milliseconds time)
{
    // Qt's own limit counts the time between two bytes.
    QTimer::singleShot(time, reply, [reply, time] {
        if (reply->isFinished())
            return;
        reply->setProperty(kTooLate, QString::number(time.count()));
        reply->abort();
    });
}

int statusOf(const QNetworkReply* reply)
{
    return reply->attribute(QNetworkRequest::HttpStatusCodeAttribute).toInt();
}

bool isComplete(const QNetworkReply* reply)
{
    if (reply->error() == QNetworkReply::NoError)
        return true;
    // Qt has errors for the statuses from 400 on, too, which come with a complete reply.
    return statusOf(reply) >= kFirstErrorStatus && reply->error() >= QNetworkReply::ContentAccessDenied &&
           reply->error() != QNetworkReply::ProtocolFailure;
}

QString failureOf(const QNetworkReply* reply)
{
    if (isTooLarge(reply))
        return QStringLiteral("the reply is over %1 MiB").arg(kMaxReplyBytes >> 20);
    if (const QString time = reply->property(kTooLate).toString(); !time.isEmpty())
        return QStringLiteral("no reply within %1 ms").arg(time);
    // The words for a status hold the whole URL.
    return isComplete(reply) ? QStringLiteral("status %1").arg(statusOf(reply)) : reply->errorString();
}

QString logUrl(const QUrl& url)
{
    return url.toString(QUrl::RemoveQuery | QUrl::RemoveFragment | QUrl::RemoveUserInfo);
}

} // namespace zent::http

// SPDX-License-Identifier: Apache-2.0
#include "messages/notification.h"

#include "gethttpheader.h"
#include "paths.h"
#include "replywatch.h"
#include "terminalinfo.h"
#include "urlquery.h"

#include <QDateTime>
#include <QDebug>
#include <QEventLoop>
#include <QJsonDocument>
#include <QJsonObject>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QTimer>
#include <QUrlQuery>

#include <algorithm>

QNotification* QNotification::qInstance = nullptr;

namespace
{

constexpr int kLargestShownNumber = 99;
constexpr int kWaitSliceMs = 100;

const QString kUnreadParameter = QStringLiteral("is_not_read");
/// The agreed spelling. Its value makes each URL unique.
const QString kTimeParameter = QStringLiteral("timestaps");

QString timeStamp()
{
    return QString::number(QDateTime::currentSecsSinceEpoch());
}

} // namespace

QNotification::QNotification(QObject* parent)
    : QObject(parent), m_listManager(new QNetworkAccessManager(this)), m_readManager(new QNetworkAccessManager(this)),
      m_readAllManager(new QNetworkAccessManager(this))
{
    loadCfg();
    connect(m_listManager, SIGNAL(finished(QNetworkReply*)), this, SLOT(messageListRequestFinished(QNetworkReply*)));
    connect(m_readManager, SIGNAL(finished(QNetworkReply*)), this, SLOT(messageReadRequestFinished(QNetworkReply*)));
    connect(m_readAllManager, SIGNAL(finished(QNetworkReply*)), this,
            SLOT(messageReadAllRequestFinished(QNetworkReply*)));
}

int QNotification::loadCfg()
{
    constexpr int kNoFile = -1;
    constexpr int kNotReadable = -2;
    constexpr int kNotJson = -3;
    int result = 0;
    zent::NotifyConfig config;
    const zent::base::FileReading info = zent::base::readTerminalInfo();
    if (!info.exists) {
        qWarning() << "open config.json file failed." << zent::kUserinfoPath;
        result = kNoFile;
    } else if (!info.opened) {
        qWarning() << "read config.json file failed.";
        result = kNotReadable;
    } else if (const auto parsed = zent::parseNotifyConfig(info.content)) {
        config = *parsed;
    } else {
        qWarning() << "parse config.json file failed.";
        result = kNotJson;
    }
    m_listUrl = config.url(QStringLiteral("list"));
    m_readUrl = config.url(QStringLiteral("read"));
    m_readAllUrl = config.url(QStringLiteral("read_all"));
    m_token = config.token;
    return result;
}

QNetworkRequest QNotification::makeRequest(const QUrl& url, const char* caller)
{
    QNetworkRequest request = zent::http::makeRequest(url);
    const GetHttpHeader* version = GetHttpHeader::GetInstance();
    qDebug() << caller << " strVersion:" << version->header();
    version->apply(request);
    request.setRawHeader("X-XSRF-TOKEN", m_token.toUtf8());
    if (url.scheme() == QLatin1String("https")) {
        followAuthority();
        request.setSslConfiguration(*m_ssl);
    }
    return request;
}

void QNotification::followAuthority()
{
    const QByteArray now = zent::http::fingerprint({zent::kServerCertPath, {}, {}});
    if (!m_ssl || now != m_authority) {
        m_oldConnections = m_ssl.has_value();
        m_authority = now;
        m_ssl = zent::http::tlsBesideSystem(zent::kServerCertPath);
    }
    if (!m_oldConnections)
        return;
    m_oldConnections = false;
    for (QNetworkAccessManager* manager : {m_listManager, m_readManager, m_readAllManager}) {
        if (manager && !zent::dropConnections(manager))
            m_oldConnections = true;
    }
}

int QNotification::getNotifyMessageList(const NotifyMessageOption& option, list_message_callback callback)
{
    const QUrl url = zent::withQuery(
        QUrl(m_listUrl), {{QStringLiteral("uid"), option.uid},
                          {kUnreadParameter, option.is_not_read ? QStringLiteral("1") : QStringLiteral("0")},
                          {QStringLiteral("limit"), QString::number(option.limit)},
                          {QStringLiteral("offset"), QString::number(option.offset)},
                          {QStringLiteral("order"), option.order},
                          {QStringLiteral("desc"), option.desc},
                          {kTimeParameter, timeStamp()}});
    qDebug() << "Rquest[GET]: " << url;
    const QNetworkRequest request = makeRequest(url, "getNotifyMessageList");
    m_listCallbacks[url] = std::move(callback);
    zent::watchReply(m_listManager->get(request), m_timeLimit);
    return 0;
}

int QNotification::getNotifyMessageList(const QString& uid, bool isNotRead, int page, int pageSize,
                                        list_message_callback callback)
{
    NotifyMessageOption option;
    option.uid = uid;
    option.is_not_read = isNotRead;
    option.limit = pageSize;
    option.offset = (std::max(page, 1) - 1) * pageSize;
    return getNotifyMessageList(option, std::move(callback));
}

int QNotification::readNotifyMessage(const QString& uuid, read_message_callback callback)
{
    put(m_readManager, m_readUrl, QStringLiteral("uuid"), uuid, "readNotifyMessage", m_readCallbacks,
        std::move(callback));
    return 0;
}

int QNotification::readAllNotifyMessage(const QString& uid, readall_message_callback callback)
{
    put(m_readAllManager, m_readAllUrl, QStringLiteral("uid"), uid, "readAllNotifyMessage", m_readAllCallbacks,
        std::move(callback));
    return 0;
}

void QNotification::put(QNetworkAccessManager* manager, const QString& baseUrl, const QString& key,
                        const QString& value, const char* caller, ReadCallbacks& callbacks,
                        read_message_callback callback)
{
    const QByteArray body = QJsonDocument(QJsonObject{{key, value}}).toJson(QJsonDocument::Compact);
    const QUrl url = zent::withQuery(QUrl(baseUrl), {{kTimeParameter, timeStamp()}});
    qDebug() << "Qurl" << url;
    const QNetworkRequest request = makeRequest(url, caller);
    callbacks[url] = std::move(callback);
    zent::watchReply(manager->put(request, body), m_timeLimit);
}

void QNotification::messageListRequestFinished(QNetworkReply* reply)
{
    // Callbacks may run an event loop, so everything is settled before one is called.
    reply->deleteLater();
    const list_message_callback callback = m_listCallbacks.take(reply->request().url());
    if (!callback)
        return;
    NotifyMessageResponse response;
    const bool ok = zent::succeeded(reply);
    if (ok) {
        const QByteArray body = reply->readAll();
        response = zent::parseMessageReply([reply](const QByteArray& name) { return reply->rawHeader(name); }, body);
        // The count alone is what most callers want; a list that is asked for and is none leaves a trace.
        if (response.messages.isEmpty() && !body.isEmpty() && body.trimmed() != "[]")
            qWarning() << "the message list holds no message";
    }
    response.is_not_read = QUrlQuery(reply->request().url()).queryItemValue(kUnreadParameter).toInt() == 1;
    callback(ok, response);
}

void QNotification::messageReadRequestFinished(QNetworkReply* reply)
{
    finishRead(reply, m_readCallbacks);
}

void QNotification::messageReadAllRequestFinished(QNetworkReply* reply)
{
    finishRead(reply, m_readAllCallbacks);
}

void QNotification::finishRead(QNetworkReply* reply, ReadCallbacks& callbacks)
{
    reply->deleteLater();
    const read_message_callback callback = callbacks.take(reply->request().url());
    if (!callback)
        return;
    // Later: the line about a failure comes first, and the callback may stay in a box until that is closed.
    QMetaObject::invokeMethod(
        this, [callback, ok = zent::succeeded(reply), text = reply->errorString()] { callback(ok, text); },
        Qt::QueuedConnection);
}

QString QNotification::getCurrentTime()
{
    return QDateTime::currentDateTime().toString(QStringLiteral("yyyy-MM-dd hh:mm:ss"));
}

QString QNotification::formatTime(const QString& serverTime, bool relative)
{
    return zent::formatServerTime(serverTime, relative, zent::displayedToday());
}

QString QNotification::formatUnReadNumber(int n)
{
    return n <= kLargestShownNumber ? QString::number(n) : QStringLiteral("...");
}

void QNotification::msleep(int ms)
{
    const QTime end = QTime::currentTime().addMSecs(ms);
    for (QTime now = QTime::currentTime(); now < end; now = QTime::currentTime()) {
        QEventLoop loop;
        QTimer::singleShot(std::min(kWaitSliceMs, now.msecsTo(end)), &loop, &QEventLoop::quit);
        // An application that is quitting runs no loop any more, and nobody waits for it.
        if (loop.exec() < 0)
            return;
    }
}

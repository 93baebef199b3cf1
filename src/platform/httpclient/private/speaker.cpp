// SPDX-License-Identifier: Apache-2.0
#include "private/speaker.h"

#include <QBuffer>
#include <QNetworkAccessManager>
#include <QNetworkProxy>

#include <algorithm>
#include <cstring>
#include <utility>

using namespace std::chrono_literals;

namespace zent::http
{

namespace
{

constexpr auto kIdleTime = 10s;

/// A body that cannot be read a second time. Qt sends a request again when its connection breaks before the reply, but
/// not this one.
class BodyOnce : public QIODevice
{
public:
    BodyOnce(const QByteArray& body, QObject* parent) : QIODevice(parent), m_body(body) { open(ReadOnly | Unbuffered); }
    bool isSequential() const override { return true; }
    // Qt tries to go back to the start, and would warn of its own attempt.
    bool seek(qint64) override { return false; }
    qint64 bytesAvailable() const override { return m_body.size() - m_read; }

protected:
    qint64 readData(char* data, qint64 size) override
    {
        const qint64 length = std::min(size, bytesAvailable());
        if (length == 0)
            return -1;
        std::memcpy(data, m_body.constData() + m_read, static_cast<size_t>(length));
        m_read += static_cast<int>(length);
        return length;
    }
    qint64 writeData(const char*, qint64) override { return -1; }

private:
    QByteArray m_body;
    int m_read = 0;
};

/// What tells one server from another.
QString serverOf(const QUrl& url)
{
    return url.scheme() + url.authority();
}

} // namespace

Speaker::Speaker(std::function<void()> onIdle) : m_idle(this)
{
    m_idle.setInterval(kIdleTime);
    m_idle.callOnTimeout(this, std::move(onIdle));
}

void Speaker::send(const std::shared_ptr<Exchange>& exchange)
{
    m_idle.stop();
    if (!m_manager) {
        m_manager = new QNetworkAccessManager(this);
        m_manager->setProxy(QNetworkProxy::NoProxy);
    }
    dropBroken();
    m_exchange = exchange;
    m_peerProblem.clear();
    if (exchange->url.scheme() == QLatin1String("https")) {
        readTlsFiles(exchange->tls);
        if (!m_tlsProblem.isEmpty())
            return end({QNetworkReply::OperationCanceledError, m_tlsProblem});
    }
    if (m_answered.count(serverOf(exchange->url)) > 0)
        noteConnected();
    m_reply = start(*exchange);
    limitReply(m_reply);
    connect(m_reply, &QNetworkReply::encrypted, this, &Speaker::noteConnected);
    connect(m_reply, &QNetworkReply::sslErrors, this,
            [this](const QList<QSslError>& errors) { m_peerProblem = errors.first().errorString(); });
    connect(m_reply, &QNetworkReply::finished, this, &Speaker::finish);
}

/// A kept connection was made with the files as they were then.
void Speaker::readTlsFiles(const TlsFiles& files)
{
    const QByteArray now = fingerprint(files);
    if (m_ssl && now == m_fingerprint)
        return;
    dropConnections();
    m_fingerprint = now;
    m_ssl = tlsOfTerminal(files, m_tlsProblem);
}

QNetworkReply* Speaker::start(const Exchange& exchange)
{
    QNetworkRequest request = makeRequest(exchange.url);
    if (m_ssl)
        request.setSslConfiguration(*m_ssl);
    if (!exchange.body.isEmpty())
        request.setHeader(QNetworkRequest::ContentTypeHeader, QByteArrayLiteral("application/json"));
    QIODevice* body = nullptr;
    if (exchange.method == "POST") {
        request.setAttribute(QNetworkRequest::DoNotBufferUploadDataAttribute, true);
        request.setHeader(QNetworkRequest::ContentLengthHeader, exchange.body.size());
        body = new BodyOnce(exchange.body, m_manager);
    } else if (!exchange.body.isEmpty()) {
        auto* buffer = new QBuffer(m_manager);
        buffer->setData(exchange.body);
        buffer->open(QIODevice::ReadOnly);
        body = buffer;
    }
    // As a verb of its own: Qt sends no body with a GET, and guesses the type of a POST that has none.
    QNetworkReply* reply = m_manager->sendCustomRequest(request, exchange.method, body);
    if (body)
        body->setParent(reply);
    return reply;
}

void Speaker::noteConnected()
{
    const std::lock_guard lock(m_exchange->mutex);
    m_exchange->connected = true;
    m_exchange->changed.notify_all();
}

void Speaker::finish()
{
    QNetworkReply* reply = std::exchange(m_reply, nullptr);
    reply->deleteLater();
    if (isComplete(reply)) {
        m_answered.insert(serverOf(m_exchange->url));
        return end({QNetworkReply::NoError, {}, statusOf(reply), reply->readAll()});
    }
    // Later: the reply is still being finished. The next exchange may come before.
    m_broken = true;
    QMetaObject::invokeMethod(
        this, [this] { dropBroken(); }, Qt::QueuedConnection);
    QString reason = failureOf(reply);
    if (!m_peerProblem.isEmpty())
        reason += QLatin1String(": ") + m_peerProblem;
    end({isTooLarge(reply) ? QNetworkReply::UnknownContentError : reply->error(), reason});
}

void Speaker::end(Result result)
{
    const auto exchange = std::exchange(m_exchange, nullptr);
    m_idle.start();
    const std::lock_guard lock(exchange->mutex);
    exchange->result = std::move(result);
    exchange->changed.notify_all();
}

void Speaker::abandon(const std::shared_ptr<Exchange>& exchange)
{
    // An exchange that has not ended has a reply.
    if (m_exchange == exchange)
        m_reply->abort();
}

/// Qt would reuse a broken connection. Each new TLS session on it leaks the previous one, about 13 KiB.
void Speaker::dropBroken()
{
    if (std::exchange(m_broken, false))
        dropConnections();
}

void Speaker::dropConnections()
{
    m_answered.clear();
    m_manager->clearConnectionCache();
}

} // namespace zent::http

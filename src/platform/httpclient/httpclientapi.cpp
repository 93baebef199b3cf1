// SPDX-License-Identifier: Apache-2.0
#include "httpclientapi.h"

#include "private/exchange.h"
#include "private/hostguard.h"
#include "private/httpthread.h"

#include <QCoreApplication>
#include <QDebug>

#include <algorithm>
#include <map>
#include <utility>

using namespace std::chrono_literals;

namespace
{

using zent::http::Exchange;
using zent::http::Result;
using zent::http::TlsFiles;
using Clock = std::chrono::steady_clock;
using Outcome = HostGuard::Outcome;

/// A failure without a connection that took this long has cost the caller as much as a time-out.
constexpr auto kLongWait = 1s;

const QString kHttps = QStringLiteral("https");

/// The URL without port 0, which stands for the default port, and what is not for the server.
QUrl urlToSend(const QString& url)
{
    QUrl parsed = QUrl(url).adjusted(QUrl::RemoveFragment | QUrl::RemoveUserInfo);
    if (parsed.port() == 0)
        parsed.setPort(-1);
    return parsed;
}

/// Why the URL cannot be asked.
Result objectionTo(const QUrl& url)
{
    if (!url.isValid() || url.host().isEmpty())
        return {QNetworkReply::HostNotFoundError, QStringLiteral("no absolute URL")};
    if (url.scheme() != kHttps && url.scheme() != QLatin1String("http"))
        return {QNetworkReply::ProtocolUnknownError, QStringLiteral("neither https nor http")};
    return {};
}

Result timeOut(const char* what, std::chrono::milliseconds time)
{
    return {QNetworkReply::TimeoutError, QStringLiteral("%1 within %2 ms").arg(QLatin1String(what)).arg(time.count())};
}

/// What a request that has ended in time says about its host.
Outcome outcomeOf(const Result& result, bool connected, Clock::duration time)
{
    if (result.error == QNetworkReply::NoError)
        return Outcome::Answered;
    if (connected)
        return Outcome::Met;
    // The resolver may give a silent name server up before the request's own time is over.
    if (time >= kLongWait)
        return Outcome::ConnectTimedOut;
    const auto signsOfLife = {QNetworkReply::ConnectionRefusedError, QNetworkReply::RemoteHostClosedError,
                              QNetworkReply::SslHandshakeFailedError};
    return std::count(signsOfLife.begin(), signsOfLife.end(), result.error) > 0 ? Outcome::Met : Outcome::Unknown;
}

} // namespace

/// What is known of the servers, and the thread that asks them.
class HttpClientApi::Session
{
public:
    enum class Kind { Get, Poll, Post };

    void setTimeout(int seconds) { m_timeout = std::chrono::seconds(std::max(seconds, 1)); }
    void setTls(const TlsFiles& files) { m_tls = files; }
    int send(QString& reply, Kind kind, const QString& url, const QString& body);
    void stop() { m_thread.stop(); }

private:
    HostGuard& guardOf(const QUrl& url);
    Result perform(const std::shared_ptr<Exchange>& exchange, Outcome& outcome);

    zent::http::HttpThread m_thread;
    std::map<QString, std::unique_ptr<HostGuard>> m_guards;
    TlsFiles m_tls;
    std::chrono::milliseconds m_timeout = 2s;
};

int HttpClientApi::Session::send(QString& reply, Kind kind, const QString& url, const QString& body)
{
    reply.clear();
    const QByteArray method = kind == Kind::Post ? QByteArrayLiteral("POST") : QByteArrayLiteral("GET");
    const QUrl target = urlToSend(url);
    const QString name = zent::http::logUrl(target);
    Result result = objectionTo(target);
    if (result.error == QNetworkReply::NoError) {
        HostGuard& guard = guardOf(target);
        const QString objection = kind == Kind::Poll ? guard.objection() : QString();
        if (!objection.isEmpty()) {
            qWarning() << method.constData() << name << "not sent:" << qPrintable(objection);
            return -guard.failure();
        }
        const auto exchange = std::make_shared<Exchange>();
        exchange->method = method;
        exchange->url = target;
        exchange->body = body.toUtf8();
        exchange->tls = m_tls;
        Outcome outcome = Outcome::Unknown;
        const Clock::time_point begin = Clock::now();
        result = perform(exchange, outcome);
        guard.note(outcome, result.error);
        if (kind == Kind::Poll)
            guard.notePollTime(std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - begin),
                               QNetworkReply::TimeoutError);
    }
    if (result.error != QNetworkReply::NoError) {
        qWarning() << method.constData() << name << "failed:" << qPrintable(result.reason);
        return -result.error;
    }
    reply = QString::fromUtf8(result.body);
    return result.status;
}

HostGuard& HttpClientApi::Session::guardOf(const QUrl& url)
{
    const int port = url.port(url.scheme() == kHttps ? 443 : 80);
    std::unique_ptr<HostGuard>& guard = m_guards[url.host() + QLatin1Char(':') + QString::number(port)];
    if (!guard)
        guard = std::make_unique<HostGuard>(url.host(), static_cast<quint16>(port));
    return *guard;
}

/// Waits without an event loop. When the time has passed it returns at once, and the request is ended behind it.
Result HttpClientApi::Session::perform(const std::shared_ptr<Exchange>& exchange, Outcome& outcome)
{
    const Clock::time_point begin = Clock::now();
    const auto connectTime = std::min(m_timeout, zent::http::kConnectTime);
    m_thread.send(exchange);
    std::unique_lock lock(exchange->mutex);
    const auto wait = [&](std::chrono::milliseconds time, const auto& reached) {
        return exchange->changed.wait_until(lock, begin + time, reached);
    };
    const bool mayConnect =
        exchange->url.scheme() != kHttps || wait(connectTime, [&] { return exchange->connected || exchange->result; });
    if (!mayConnect || !wait(m_timeout, [&] { return exchange->result.has_value(); })) {
        lock.unlock();
        m_thread.abandon(exchange);
        outcome = mayConnect ? Outcome::ReplyTimedOut : Outcome::ConnectTimedOut;
        return mayConnect ? timeOut("no reply", m_timeout) : timeOut("no connection", connectTime);
    }
    outcome = outcomeOf(*exchange->result, exchange->connected, Clock::now() - begin);
    return std::move(*exchange->result);
}

HttpClientApi::HttpClientApi(QObject* parent, bool reserved) : QObject(parent), m_session(std::make_unique<Session>())
{
    Q_UNUSED(reserved)
    // An object that outlives the application would end the thread when Qt's own parts of it are gone.
    if (QCoreApplication::instance())
        connect(QCoreApplication::instance(), &QCoreApplication::aboutToQuit, this, [this] { m_session->stop(); });
}

HttpClientApi::~HttpClientApi() = default;

void HttpClientApi::setReplyTimer(const int& seconds)
{
    m_session->setTimeout(seconds);
}

void HttpClientApi::setSSLConfig(const QString& ca, const QString& cert, const QString& key)
{
    m_session->setTls({ca, cert, key});
}

int HttpClientApi::getRequest(QString& reply, const QString& url, const QString& body, bool reserved)
{
    Q_UNUSED(reserved)
    return m_session->send(reply, Session::Kind::Get, url, body);
}

int HttpClientApi::pollRequest(QString& reply, const QString& url, const QString& body)
{
    return m_session->send(reply, Session::Kind::Poll, url, body);
}

int HttpClientApi::postRequest(QString& reply, const QString& url, const QString& body, bool reserved)
{
    Q_UNUSED(reserved)
    return m_session->send(reply, Session::Kind::Post, url, body);
}

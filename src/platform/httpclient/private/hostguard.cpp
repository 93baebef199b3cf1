// SPDX-License-Identifier: Apache-2.0
#include "private/hostguard.h"

#include "httprules.h"
#include "lookups.h"

#include <QDebug>
#include <QNetworkProxy>
#include <QTcpSocket>

#include <algorithm>
#include <utility>

using namespace std::chrono_literals;

namespace
{

constexpr auto kFirstDelay = 2s;
constexpr auto kLongestTryInterval = 30s;
constexpr auto kFirstHold = 20s;
constexpr auto kLongestHold = 60s;
constexpr auto kSlow = 100ms;
/// After a poll that took a time t, none is sent for this many times t. So polls take at most a tenth of the time.
constexpr int kSlowFactor = 10;
constexpr auto kLongestSlowHold = 30s;

} // namespace

HostGuard::HostGuard(const QString& host, quint16 port, QObject* parent) : QObject(parent), m_host(host), m_port(port)
{
    connect(&m_nextTry, &QTimer::timeout, this, &HostGuard::startTry);
    connect(&m_tryLimit, &QTimer::timeout, this, &HostGuard::endTry);
}

HostGuard::~HostGuard()
{
    stopTrying();
}

QString HostGuard::name() const
{
    return QStringLiteral("%1:%2").arg(m_host).arg(m_port);
}

QString HostGuard::objection() const
{
    if (m_state == State::Unreachable)
        return QStringLiteral("no connection to %1 so far").arg(name());
    if (m_heldUntil.hasExpired())
        return {};
    const QString why =
        m_state == State::NoReply ? QStringLiteral("gave no reply in time") : QStringLiteral("is slow to answer");
    return QStringLiteral("%1 %2, next try in %3 s")
        .arg(name(), why, QString::number((m_heldUntil.remainingTime() + 999) / 1000));
}

void HostGuard::note(Outcome outcome, int result)
{
    switch (outcome) {
    case Outcome::Answered:
        m_holdPeriod = 0ms;
        answersAgain();
        break;
    case Outcome::Met:
        // Only a reply ends a hold: the host was connected to all the time.
        if (m_state == State::Unreachable)
            answersAgain();
        break;
    case Outcome::ConnectTimedOut:
        m_failure = result;
        if (m_state == State::Unreachable)
            break;
        m_state = State::Unreachable;
        m_heldUntil = QDeadlineTimer();
        m_tryInterval = kFirstDelay;
        m_nextTry.start(m_tryInterval);
        break;
    case Outcome::ReplyTimedOut:
        stopTrying();
        m_failure = result;
        m_state = State::NoReply;
        m_holdPeriod = std::clamp<std::chrono::milliseconds>(2 * m_holdPeriod, kFirstHold, kLongestHold);
        m_heldUntil.setRemainingTime(m_holdPeriod);
        break;
    case Outcome::Unknown:
        break;
    }
}

void HostGuard::notePollTime(std::chrono::milliseconds time, int result)
{
    const auto period = std::min<std::chrono::milliseconds>(kSlowFactor * time, kLongestSlowHold);
    if (time <= kSlow || m_state == State::Unreachable || m_heldUntil.remainingTimeAsDuration() >= period)
        return;
    m_failure = result;
    m_heldUntil.setRemainingTime(period);
}

void HostGuard::answersAgain()
{
    stopTrying();
    const State before = std::exchange(m_state, State::Reachable);
    if (before == State::NoReply)
        m_heldUntil = QDeadlineTimer();
    if (before != State::Reachable)
        qInfo().noquote() << name() << "answers again";
}

void HostGuard::startTry()
{
    m_tryInterval = std::min<std::chrono::milliseconds>(2 * m_tryInterval, kLongestTryInterval);
    m_nextTry.start(m_tryInterval);
    // A connection that takes longer would let the next request time out again.
    m_tryLimit.start(zent::http::kConnectTime);
    const QHostAddress address(m_host);
    if (!address.isNull())
        return connectTo({address});
    m_lookup =
        QHostInfo::lookupHost(m_host, this, [this, end = zent::http::noteLookup(m_host)](const QHostInfo& found) {
            end();
            m_lookup = -1;
            connectTo(found.addresses());
        });
}

void HostGuard::connectTo(const QList<QHostAddress>& addresses)
{
    // At the same time, not one after the other: the first address may be one that nobody can reach from here.
    for (const QHostAddress& address : addresses) {
        auto* socket = new QTcpSocket(this);
        m_sockets.push_back(socket);
        socket->setProxy(QNetworkProxy::NoProxy);
        connect(socket, &QTcpSocket::connected, this, &HostGuard::answersAgain);
        connect(socket, &QTcpSocket::errorOccurred, this, [this](QAbstractSocket::SocketError error) {
            if (error == QAbstractSocket::ConnectionRefusedError)
                answersAgain();
        });
        socket->connectToHost(address, m_port);
        // A refusal may be known at once.
        if (m_state != State::Unreachable)
            return;
    }
}

void HostGuard::endTry()
{
    m_tryLimit.stop();
    if (m_lookup != -1)
        QHostInfo::abortHostLookup(std::exchange(m_lookup, -1));
    for (QTcpSocket* socket : std::exchange(m_sockets, {})) {
        socket->disconnect(this);
        socket->abort();
        socket->deleteLater();
    }
}

void HostGuard::stopTrying()
{
    m_nextTry.stop();
    endTry();
}

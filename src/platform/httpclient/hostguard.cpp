#include "hostguard.h"

#include "curloptions.h"

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
constexpr auto kLongestHoldPeriod = 60s;

} // namespace

HostGuard::HostGuard(const QString& host, quint16 port, QObject* parent) : QObject(parent), m_host(host), m_port(port)
{
    m_nextTry.setSingleShot(true);
    m_tryLimit.setSingleShot(true);
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
    if (m_state == State::HeldBack && !m_heldUntil.hasExpired())
        return QStringLiteral("%1 gave no reply in time, next try in %2 s")
            .arg(name())
            .arg(m_heldUntil.remainingTime() / 1000 + 1);
    return {};
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
        m_tryInterval = kFirstDelay;
        m_nextTry.start(m_tryInterval);
        break;
    case Outcome::ReplyTimedOut:
        stopTrying();
        m_failure = result;
        m_state = State::HeldBack;
        m_holdPeriod = std::clamp<std::chrono::milliseconds>(2 * m_holdPeriod, kFirstDelay, kLongestHoldPeriod);
        m_heldUntil.setRemainingTime(m_holdPeriod);
        break;
    case Outcome::Unknown:
        break;
    }
}

void HostGuard::answersAgain()
{
    stopTrying();
    if (std::exchange(m_state, State::Reachable) != State::Reachable)
        qInfo().noquote() << name() << "answers again";
}

void HostGuard::startTry()
{
    m_tryInterval = std::min<std::chrono::milliseconds>(2 * m_tryInterval, kLongestTryInterval);
    m_nextTry.start(m_tryInterval);
    // A connection that takes longer would let the next request time out again.
    m_tryLimit.start(zent::http::kConnectTimeoutMs);
    m_lookup = QHostInfo::lookupHost(m_host, this, [this](const QHostInfo& addresses) { connectTo(addresses); });
}

void HostGuard::connectTo(const QHostInfo& addresses)
{
    m_lookup = -1;
    // At the same time, not one after the other: the first address may be one that nobody can reach from here.
    for (const QHostAddress& address : addresses.addresses()) {
        auto* socket = new QTcpSocket(this);
        m_sockets.push_back(socket);
        socket->setProxy(QNetworkProxy::NoProxy);
        connect(socket, &QTcpSocket::connected, this, [this] { note(Outcome::Met, 0); });
        connect(socket, &QTcpSocket::errorOccurred, this, [this](QAbstractSocket::SocketError error) {
            if (error == QAbstractSocket::ConnectionRefusedError)
                note(Outcome::Met, 0);
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

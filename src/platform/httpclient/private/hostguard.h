// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDeadlineTimer>
#include <QHostInfo>
#include <QObject>
#include <QTimer>

#include <chrono>
#include <vector>

class QTcpSocket;

/// Decides whether polls are sent to one host. A host that is slow, or lets requests time out, then blocks the caller
/// for a small part of the time only. Whatever is no poll is always sent.
///
/// After a connect time-out the host is unreachable. Connections are then attempted without blocking, after 2 s, 4 s
/// and so on up to every 30 s. No poll is sent until one succeeds or is refused. After a reply time-out no poll is sent
/// for 20 s. This doubles up to 60 s with every time-out, until a request is answered. After a poll that took more than
/// 100 ms, whatever it returned, none is sent for ten times as long, 30 s at most. The attempts need the event loop of
/// the object's thread; while the host is reachable no timer runs.
class HostGuard : public QObject
{
    Q_OBJECT

public:
    /// What a request that was sent tells about its host.
    enum class Outcome {
        Answered,        ///< a complete reply
        Met,             ///< a connection or a refusal, but no reply
        ConnectTimedOut, ///< no connection within its time
        ReplyTimedOut,   ///< a connection, but no reply within its time
        Unknown          ///< failed for a reason of this side, and without delay
    };

    HostGuard(const QString& host, quint16 port, QObject* parent = nullptr);
    ~HostGuard() override;

    /// Why a poll must not be sent now, for the log; empty when it may be.
    QString objection() const;
    /// The result of a poll that must not be sent.
    int failure() const { return m_failure; }
    /// Takes in how a request ended; `result` is what failure() is to return from now on.
    void note(Outcome outcome, int result);
    /// Takes in how long a poll has taken; `result` as with note().
    void notePollTime(std::chrono::milliseconds time, int result);

private:
    enum class State { Reachable, Unreachable, NoReply };

    QString name() const;
    void answersAgain();
    void startTry();
    void connectTo(const QList<QHostAddress>& addresses);
    void endTry();
    void stopTrying();

    QString m_host;
    quint16 m_port;
    State m_state = State::Reachable;
    int m_failure = 0;
    std::chrono::milliseconds m_holdPeriod{0};
    QDeadlineTimer m_heldUntil;
    std::chrono::milliseconds m_tryInterval{0};
    QTimer m_nextTry{this};
    QTimer m_tryLimit{this};
    int m_lookup = -1;
    std::vector<QTcpSocket*> m_sockets;
};

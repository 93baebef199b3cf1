// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "private/exchange.h"

#include <QObject>
#include <QSslConfiguration>
#include <QTimer>

#include <functional>
#include <memory>
#include <optional>
#include <set>

class QNetworkAccessManager;

namespace zent::http
{

/// Speaks HTTP in a thread of its own, one exchange at a time. Connections are kept until a request fails or a file of
/// the TLS configuration changes.
class Speaker : public QObject
{
public:
    /// `onIdle` is called when nothing has been asked for 10 s.
    explicit Speaker(std::function<void()> onIdle);

    void send(const std::shared_ptr<Exchange>& exchange);
    void abandon(const std::shared_ptr<Exchange>& exchange);

private:
    void readTlsFiles(const TlsFiles& files);
    QNetworkReply* start(const Exchange& exchange);
    void noteConnected();
    void finish();
    void end(Result result);
    void dropBroken();
    void dropConnections();

    QTimer m_idle;
    QNetworkAccessManager* m_manager = nullptr;
    std::shared_ptr<Exchange> m_exchange;
    QNetworkReply* m_reply = nullptr;
    /// A request has failed, and connections have not been dropped since.
    bool m_broken = false;
    QByteArray m_fingerprint;
    /// Comes with the first HTTPS request: making even an empty one loads OpenSSL.
    std::optional<QSslConfiguration> m_ssl;
    QString m_tlsProblem;
    QString m_peerProblem;
    /// Hosts that have answered since connections were last dropped.
    std::set<QString> m_answered;
};

} // namespace zent::http

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>
#include <QString>

#include <memory>

/// A blocking HTTP client for the management server.
///
/// A request returns when its reply is complete or has failed; no event loop runs meanwhile. It is done in a thread of
/// its own, which ends after 10 s without a request. Connections are kept until then, until a failure, or until the SSL
/// configuration or one of its files changes. Only the configured certificate authority is trusted, host names are
/// checked and TLS 1.2 is the least version accepted. Redirects are not followed; proxies named by the environment are
/// not used. A POST is never sent twice.
///
/// A host that lets requests time out, or is slow, does not hold up poll after poll (HostGuard): its polls then fail at
/// once for a while. Whatever is no poll is always sent. Every request that fails, sent or not, leaves one log line.
///
/// An object belongs to one thread.
class HttpClientApi : public QObject
{
    Q_OBJECT

public:
    /// @param parent owner, may be null
    /// @param reserved has no effect; callers pass false
    HttpClientApi(QObject* parent, bool reserved);
    ~HttpClientApi() override;

    /// Bounds the time of each following request, from the name lookup to the end of the reply. Connecting, TLS
    /// handshake included, gets at most 1.5 seconds of it.
    /// @param seconds at least 1, smaller values count as 1; 2 until this is called
    void setReplyTimer(const int& seconds);

    /// Sets the files for HTTPS, all PEM. They are read when a connection is made, so a path may name a file that comes
    /// into being later; while it is missing, HTTPS requests fail.
    /// @param ca the only certificate authorities to trust; none when empty, every HTTPS request then fails
    /// @param cert the client certificate to present; none when empty
    /// @param key the certificate's private key, not encrypted; looked for in `cert` when empty
    void setSSLConfig(const QString& ca, const QString& cert, const QString& key);

    /// Sends a GET and waits for its reply.
    /// @param reply receives the reply's body, decoded from UTF-8; emptied on failure
    /// @param url absolute, http or https; port 0 stands for the scheme's default port
    /// @param body sent as JSON when not empty
    /// @param reserved has no effect; callers pass true
    /// @return the HTTP status whatever it is, or the negated QNetworkReply::NetworkError when no complete reply came
    ///     (the log says why)
    int getRequest(QString& reply, const QString& url, const QString& body, bool reserved);

    /// The same for a request that is repeated until it succeeds. It is not sent while the host is held back. The
    /// result is then that of the request that timed out, or that of a time-out.
    int pollRequest(QString& reply, const QString& url, const QString& body);

    /// Sends a POST and waits for its reply; parameters and result as with getRequest().
    int postRequest(QString& reply, const QString& url, const QString& body, bool reserved);

private:
    class Session;
    std::unique_ptr<Session> m_session;
};

#pragma once

#include <QObject>
#include <QString>

#include <memory>

/// A blocking HTTP client for the management server.
///
/// A request returns when its reply is complete or has failed; no event loop runs meanwhile. Connections are kept alive
/// and reused by later requests, until the SSL configuration or one of its files changes. Only the configured
/// certificate authority is trusted, host names are checked and TLS 1.2 is the least version accepted. Redirects are
/// not followed; proxies and passwords named by the environment are not used.
///
/// A host that lets requests time out does not do so poll after poll (HostGuard): after a connect time-out, a silent
/// name server included, its GETs fail at once until the host answers a connection attempt, which the event loop of
/// this thread makes in the background; after a reply time-out they do for 2 s, doubling to 60 s, until a request is
/// answered. POSTs, which a person has started, are always sent. A refused connection costs no time and holds nothing
/// back. Every GET that fails leaves one log line, sent or not; the polls of a client that was started during an outage
/// (every 2 s and every 3 s) make 72,000 a day of it, no more than a server that refuses connections does.
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
    /// @return the HTTP status whatever it is, or the negated CURLcode when no complete reply came (the log says why);
    ///     when it was not sent, that of the request that timed out
    int getRequest(QString& reply, const QString& url, const QString& body, bool reserved);

    /// Sends a POST and waits for its reply; parameters and result as with getRequest().
    int postRequest(QString& reply, const QString& url, const QString& body, bool reserved);

private:
    class Session;
    std::unique_ptr<Session> m_session;
};

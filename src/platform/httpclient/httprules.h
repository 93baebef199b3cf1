// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>

#include <chrono>

class QNetworkAccessManager;
class QNetworkReply;
class QNetworkRequest;
class QSslConfiguration;
class QUrl;

/// How this client speaks HTTP: what its requests have in common, whom it trusts, and what it takes for an answer.
namespace zent::http
{

/// The status of a request that succeeded.
constexpr int kOk = 200;
/// The largest body that is read.
constexpr qint64 kMaxReplyBytes = 16LL * 1024 * 1024;
/// How long a management request may take to reach its server, TLS handshake included.
constexpr std::chrono::milliseconds kConnectTime{1500};
/// How long a request may take that nobody waits for.
constexpr std::chrono::milliseconds kBackgroundTime{30000};

/// Has network managers do without the plugins that watch the machine's connections: nobody here asks for them, and
/// they cost time at the start and memory. Call it before the first manager is made.
void leaveOutBearers();

/// PEM files that say whom to trust and as whom to appear.
struct TlsFiles {
    QString ca;   ///< the authorities; nobody is trusted without them
    QString cert; ///< the certificate to present, and the chain to its authority; none when empty
    QString key;  ///< its private key; looked for in `cert` when empty
};

/// Changes whenever another file is named, and when one is written, replaced or removed.
QByteArray fingerprint(const TlsFiles& files);

/// The configuration of a server that only the given authority vouches for. On failure `problem` says which file is to
/// blame, and nothing may be sent.
QSslConfiguration tlsOfTerminal(const TlsFiles& files, QString& problem);

/// The configuration of a server that the authority in the file `ca` or one of the system's vouches for.
QSslConfiguration tlsBesideSystem(const QString& ca);

/// A request as all are: HTTP/1.1, no redirects, cookies, cache or compression.
QNetworkRequest makeRequest(const QUrl& url);

/// Ends the reply as soon as its body is known to be over the limit, and keeps no more than that in memory. Nothing may
/// be read from it before its end.
void limitReply(QNetworkReply* reply);
/// Whether that has ended it.
bool isTooLarge(const QNetworkReply* reply);
/// Ends the reply when it is not complete after that time, however it comes in.
void limitTime(QNetworkReply* reply, std::chrono::milliseconds time);

/// The status that has been received, 0 without one.
int statusOf(const QNetworkReply* reply);
/// Whether the reply has come whole, whatever its status.
bool isComplete(const QNetworkReply* reply);
/// Why it has not, in words for the log; no URL is among them.
QString failureOf(const QNetworkReply* reply);

/// The URL as it may be shown in the log: queries hold user names.
QString logUrl(const QUrl& url);

} // namespace zent::http

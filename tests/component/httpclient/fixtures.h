#pragma once

#include "httpclientapi.h"

#include <QElapsedTimer>
#include <QSemaphore>
#include <QTcpServer>
#include <QTcpSocket>
#include <QThread>

#include <functional>
#include <memory>

inline const QString kCa = QStringLiteral("/etc/zent/clientapi_ca.crt");
inline const QString kCert = QStringLiteral("/etc/zent/QEL_Zent.pem");
inline const QString kKey = QStringLiteral("/etc/zent/.QEL_Zent.key");
inline const QString kServer = QStringLiteral("https://server.zent.test:443");
inline const QString kStatusUrl = kServer + QStringLiteral("/uim/v3/client/status");

/// A client with the terminal's own certificates, its last reply and how long that took.
struct Client {
    explicit Client(const QString& ca = kCa, const QString& cert = kCert, const QString& key = kKey)
    {
        api.setReplyTimer(2);
        api.setSSLConfig(ca, cert, key);
    }
    int get(const QString& url, const QString& body = {})
    {
        return timed([&] { return api.getRequest(reply, url, body, true); });
    }
    int post(const QString& url, const QString& body)
    {
        return timed([&] { return api.postRequest(reply, url, body, true); });
    }

    HttpClientApi api{nullptr, false};
    QString reply = QStringLiteral("from before");
    qint64 elapsedMs = 0;

private:
    int timed(const std::function<int()>& request)
    {
        QElapsedTimer timer;
        timer.start();
        const int result = request();
        elapsedMs = timer.elapsed();
        return result;
    }
};

/// A server for what the platform does not do: serves one connection in a thread of its own.
class RawServer
{
public:
    /// @param serve is called with the connected socket, which is closed afterwards
    explicit RawServer(std::function<void(QTcpSocket&)> serve)
    {
        QSemaphore listening;
        m_thread.reset(QThread::create([this, &listening, serve = std::move(serve)] {
            QTcpServer server;
            server.listen(QHostAddress::LocalHost);
            m_port = server.serverPort();
            listening.release();
            if (!server.waitForNewConnection(10000))
                return;
            const std::unique_ptr<QTcpSocket> socket(server.nextPendingConnection());
            serve(*socket);
        }));
        m_thread->start();
        listening.acquire();
    }
    ~RawServer() { m_thread->wait(); }

    QString url(const QString& scheme) const { return scheme + QStringLiteral("://127.0.0.1:%1/").arg(m_port); }

private:
    std::unique_ptr<QThread> m_thread;
    quint16 m_port = 0;
};

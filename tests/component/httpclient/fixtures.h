#pragma once

#include "httpclientapi.h"

#include <QElapsedTimer>
#include <QSemaphore>
#include <QTcpServer>
#include <QTcpSocket>
#include <QThread>

#include <functional>
#include <memory>

inline const QString kCa = "/etc/zent/clientapi_ca.crt";
inline const QString kCert = "/etc/zent/QEL_Zent.pem";
inline const QString kKey = "/etc/zent/.QEL_Zent.key";
inline const QString kServer = "https://server.zent.test:443";
inline const QString kStatusUrl = kServer + "/uim/v3/client/status";

/// A client with the terminal's own certificates, its last reply and how long that took.
struct Client {
    explicit Client(const QString& ca = kCa, const QString& cert = kCert, const QString& key = kKey)
    {
        api.setReplyTimer(2);
        api.setSSLConfig(ca, cert, key);
    }
    int get(const QString& url, const QString& body = {}) { return request(&HttpClientApi::getRequest, url, body); }
    int post(const QString& url, const QString& body) { return request(&HttpClientApi::postRequest, url, body); }

    HttpClientApi api{nullptr, false};
    QString reply = "from before";
    qint64 elapsedMs = 0;

private:
    int request(int (HttpClientApi::*send)(QString&, const QString&, const QString&, bool), const QString& url,
                const QString& body)
    {
        QElapsedTimer timer;
        timer.start();
        const int result = (api.*send)(reply, url, body, true);
        elapsedMs = timer.elapsed();
        return result;
    }
};

/// A server for what the platform does not do: serves one connection in a thread of its own.
class RawServer
{
public:
    /// @param serve is called with the connected socket, which is closed afterwards
    explicit RawServer(const std::function<void(QTcpSocket&)>& serve)
    {
        QSemaphore listening;
        m_thread.reset(QThread::create([this, &listening, serve] {
            QTcpServer server;
            server.listen(QHostAddress::LocalHost);
            m_port = server.serverPort();
            listening.release();
            if (server.waitForNewConnection(10000))
                serve(*std::unique_ptr<QTcpSocket>(server.nextPendingConnection()));
        }));
        m_thread->start();
        listening.acquire();
    }
    ~RawServer() { m_thread->wait(); }

    QString url(const QString& scheme) const { return scheme + QString("://127.0.0.1:%1/").arg(m_port); }

private:
    std::unique_ptr<QThread> m_thread;
    quint16 m_port = 0;
};

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "httpclientapi.h"
#include "httprules.h"
#include "lookups.h"
#include "platformcontrol.h"

#include <QElapsedTimer>
#include <QNetworkProxy>
#include <QProcess>
#include <QTemporaryDir>
#include <QUdpSocket>

namespace
{

const QString kCa = "/etc/zent/clientapi_ca.crt";
const QString kCert = "/etc/zent/QEL_Zent.pem";
const QString kKey = "/etc/zent/.QEL_Zent.key";
const QString kTls = "/run/room/tls/";
const QString kServer = "https://server.zent.test:443";
const QString kStatusUrl = kServer + "/uim/v3/client/status";
const QString kJoinUrl = kServer + "/uim/v3/client/join";
constexpr int kTimedOut = -QNetworkReply::TimeoutError;
/// More than a request that is not sent takes, less than any time-out.
constexpr int kAtOnceMs = 300;

/// A client with the terminal's own certificates, and its last reply.
struct Client {
    /// @param seconds for a reply; what the client does by itself when negative
    explicit Client(int seconds = 2)
    {
        if (seconds >= 0)
            api.setReplyTimer(seconds);
        api.setSSLConfig(kCa, kCert, kKey);
    }
    int get(const QString& url, const QString& body = {}) { return api.getRequest(reply, url, body, true); }
    int post(const QString& url, const QString& body) { return api.postRequest(reply, url, body, true); }
    int poll(const QString& url) { return api.pollRequest(reply, url, {}); }
    /// Fails unless a poll fails like that, with one line of the log; it waits where the line says how long.
    void failPoll(const QString& url, const QString& reason, int result = kTimedOut)
    {
        const LogCapture log;
        QElapsedTimer timer;
        timer.start();
        QCOMPARE(poll(url), result);
        QCOMPARE(timer.elapsed() > kAtOnceMs, reason.startsWith("failed"));
        fixture::compareLog(log, QJsonArray{"warning GET \"" + url + "\" " + reason});
    }

    HttpClientApi api{nullptr, false};
    QString reply;
};

void openssl(const QString& arguments)
{
    QProcess program;
    program.start("openssl", arguments.split(' '));
    if (!program.waitForFinished() || program.exitCode() != 0)
        qFatal("openssl %s: %s", qPrintable(arguments), program.readAllStandardError().constData());
}

/// How many threads of this name the process has.
int threadsNamed(const QByteArray& name)
{
    int count = 0;
    for (const QString& task : QDir("/proc/self/task").entryList(QDir::Dirs | QDir::NoDotAndDotDot))
        count += testfiles::read("/proc/self/task/" + task + "/comm").trimmed() == name ? 1 : 0;
    return count;
}

} // namespace

class TestHttpClient : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    QTemporaryDir m_files;

    QString file(const QString& name) const { return m_files.filePath(name); }
    /// Issues a client's certificate with a key of its own, both as NAME.crt and NAME.key.
    void issue(const QString& name, const QString& authority, const QString& section, const QString& key) const
    {
        openssl(QString("req -x509 -newkey %1 -nodes -config %2openssl.cnf -extensions %3 -subj /CN=%4 -days 3 "
                        "-CA %5.crt -CAkey %5.key -keyout %6.key -out %6.crt")
                    .arg(key, kTls, section, name, authority, file(name)));
    }

private slots:
    void initTestCase()
    {
        // Debian's own configuration refuses old versions of TLS, whatever a client does.
        testfiles::write(file("openssl.cnf"), "openssl_conf = all\n[all]\nssl_conf = ssl\n[ssl]\nsystem_default = any\n"
                                              "[any]\nMinProtocol = TLSv1\nCipherString = ALL:@SECLEVEL=0\n");
        qputenv("OPENSSL_CONF", file("openssl.cnf").toLocal8Bit());
        issue("rsa", kTls + "ca", "client", "rsa:2048");
        issue("between", kTls + "ca", "authority", "rsa:2048");
        issue("leaf", file("between"), "client", "rsa:2048");
        testfiles::write(file("chain"), testfiles::read(file("leaf.crt")) + testfiles::read(file("between.crt")));
        testfiles::write(file("both"), testfiles::read(kCert) + testfiles::read(kKey));
        testfiles::write(file("garbage"), "-----BEGIN CERTIFICATE-----\nAAAA\n-----END CERTIFICATE-----\n");
        openssl(QString("pkey -in %1 -aes256 -passout pass:x -out %2").arg(kKey, file("encrypted")));
        testfiles::write(file("unreadable"), testfiles::read(kKey));
        QVERIFY(QFile::setPermissions(file("unreadable"), {}));
    }
    void init()
    {
        m_platform.clearFaults();
        const QJsonObject tls{{"certificate", "server"}, {"newest", ""}};
        m_platform.patchState({{"listening", true}, {"black_hole", false}, {"tls", tls}});
        m_platform.clearRecord();
    }

    void exchanges_data() { fixture::addRows("exchanges.json"); }
    void exchanges()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        Client client(20);
        QCOMPARE(client.get(kStatusUrl), 200);
        const QJsonValue connection = m_platform.record("http").last()["connection"];
        m_platform.clearRecord();
        m_platform.addFault({{"path", "/t"}}, row["action"].toObject());
        m_platform.patchState({{"tls", row["tls"].toObject()}});
        // Relative paths are those of this test's files.
        const auto path = [&](const char* which, const QString& usual) {
            const QString name = row[which].toString(usual);
            return name.isEmpty() ? name : QDir(m_files.path()).filePath(name);
        };
        client.api.setSSLConfig(path("ca", kCa), path("certificate", kCert), path("key", kKey));
        const QString url = row["url"].toString(kStatusUrl);
        const QString body = row["body"].toString().repeated(row["times"].toInt(1));
        QCOMPARE(row["post"].toBool() ? client.post(url, body) : client.get(url, body), row["result"].toInt());
        if (row.contains("reply"))
            QCOMPARE(client.reply, row["reply"].toString(QString(row["reply"].toInt(), 'x')));
        const QList<QJsonObject> requests = m_platform.record("http");
        QJsonObject request = requests.value(requests.size() - 1);
        request["kept"] = request["connection"] == connection;
        request["whole"] = request["body"] == body;
        request["count"] = requests.size();
        const QJsonObject expected = row["request"].toObject();
        for (auto value = expected.begin(); value != expected.end(); ++value)
            fixture::compare(QJsonArray{value.key(), request[value.key()]}, QJsonArray{value.key(), value.value()});
        // What came of it is not kept.
        init();
        client.api.setSSLConfig(kCa, kCert, kKey);
        QCOMPARE(client.get(kStatusUrl), 200);
        QVERIFY(!zent::http::mayBeLookingUp());
        fixture::compareLog(log, row["log"]);
    }

    void nothingButTheServerIsAsked()
    {
        const QJsonObject headers{{"Set-Cookie", "a=b; Path=/"}, {"Cache-Control", "public, max-age=600"}};
        m_platform.addFault({{"path", "/t"}}, {{"body", "{}"}, {"headers", headers}});
        QNetworkProxy::setApplicationProxy(QNetworkProxy(QNetworkProxy::HttpProxy, "127.0.0.1", 9));
        Client client;
        const QList<int> results{client.get(kServer + "/t"), client.get(kServer + "/t"),
                                 client.get("http://server.zent.test:0/none")};
        QNetworkProxy::setApplicationProxy(QNetworkProxy::NoProxy);
        QCOMPARE(results, QList<int>({200, 200, 404}));
        const QList<QJsonObject> requests = m_platform.record("http");
        QCOMPARE(requests.size(), 3);
        QVERIFY(!requests[1]["headers"].toObject().contains("cookie"));
    }

    void theAuthoritysFileIsFollowed()
    {
        const QString ca = file("ca.crt");
        QCOMPARE(zent::http::tlsBesideSystem(kCa).protocol(), QSsl::TlsV1_2OrLater);
        Client client;
        client.api.setSSLConfig(ca, kCert, kKey);
        for (const QString& copied : {QString(), kCa, kTls + "unknown_ca.crt"}) {
            if (!copied.isEmpty())
                testfiles::write(ca, testfiles::read(copied));
            QCOMPARE(client.get(kStatusUrl), copied == kCa ? 200 : -QNetworkReply::SslHandshakeFailedError);
        }
    }

    void theThreadEndsWhenNothingIsAsked()
    {
        Client client(-1);
        QCOMPARE(client.get(kStatusUrl), 200);
        QCOMPARE(threadsNamed("http"), 1);
        QTRY_COMPARE_WITH_TIMEOUT(threadsNamed("http"), 0, 15000);
        m_platform.addFault({{"path", "*/status"}}, {{"delay_ms", 3000}});
        m_platform.addFault({{"path", "*/join"}}, {{"delay_ms", 1500}});
        client.failPoll(kStatusUrl, "failed: no reply within 2000 ms");
        client.failPoll(kStatusUrl, "not sent: server.zent.test:443 gave no reply in time, next try in * s");
        // Any answer ends that; the late one of the poll does not come in between.
        QCOMPARE(client.post(kJoinUrl, "{}"), 200);
        m_platform.clearFaults();
        QCOMPARE(client.poll(kStatusUrl), 200);
        m_platform.addFault({{"path", "*/join"}}, {{"hang", true}});
        client.api.setReplyTimer(0);
        client.failPoll(kJoinUrl, "failed: no reply within 1000 ms");
        QElapsedTimer timer;
        timer.start();
        QVERIFY(QMetaObject::invokeMethod(qApp, "aboutToQuit"));
        QVERIFY2(timer.elapsed() < 1000, qPrintable(QString::number(timer.elapsed())));
        // The kernel lists a thread for a moment longer than it runs.
        QTRY_COMPARE(threadsNamed("http"), 0);
    }

    void unreachableHostIsTriedInTheBackground()
    {
        m_platform.patchState({{"black_hole", true}});
        Client client;
        client.failPoll(kStatusUrl, "failed: no connection within 1500 ms");
        // Another port of the same host stands for itself.
        client.failPoll("http://server.zent.test/none", "failed: no reply within 2000 ms");
        // What is no poll is sent all the same.
        QElapsedTimer timer;
        timer.start();
        QVERIFY(client.get(kStatusUrl) == kTimedOut && timer.elapsed() > kAtOnceMs);
        client.failPoll(kStatusUrl, "not sent: no connection to server.zent.test:443 so far");
        client.failPoll("http://server.zent.test/none",
                        "not sent: server.zent.test:80 gave no reply in time, next try in * s");
        const LogCapture log;
        m_platform.patchState({{"black_hole", false}});
        QTRY_VERIFY_WITH_TIMEOUT(log.contains("server.zent.test:443 answers again"), 10000);
        QVERIFY(m_platform.record("http").isEmpty());
        QCOMPARE(client.get(kStatusUrl), 200);
    }

    void aRefusalEndsTheOutage()
    {
        m_platform.patchState({{"black_hole", true}});
        Client client;
        client.failPoll(kStatusUrl, "failed: no connection within 1500 ms");
        m_platform.patchState({{"black_hole", false}, {"listening", false}});
        // No event loop runs in between.
        const LogCapture log;
        QCOMPARE(client.get(kStatusUrl), -QNetworkReply::ConnectionRefusedError);
        QCOMPARE(log.records().value(0), QString("info server.zent.test:443 answers again"));
        m_platform.patchState({{"listening", true}});
        QCOMPARE(client.poll(kStatusUrl), 200);
        // A connection that is open already falls silent instead.
        m_platform.patchState({{"black_hole", true}});
        client.failPoll(kStatusUrl, "failed: no reply within 2000 ms");
    }

    void slowHostsAreHeldBack()
    {
        m_platform.addFault({{"path", "/slow"}}, {{"delay_ms", 250}, {"status", 503}});
        Client client;
        QCOMPARE(client.poll(kServer + "/slow"), 503);
        client.failPoll(kServer + "/slow", "not sent: server.zent.test:443 is slow to answer, next try in * s");
        QCOMPARE(client.get(kServer + "/slow"), 503);
        // It is asked thrice, and no connection is known to have come about.
        m_platform.addFault({{"path", "/late"}}, {{"delay_ms", 400}, {"status", 204}, {"drop", "mid"}});
        const QString late = "http://server.zent.test:80/late";
        constexpr int kClosed = -QNetworkReply::RemoteHostClosedError;
        client.failPoll(late, "failed: Connection closed", kClosed);
        client.failPoll(late, "not sent: no connection to server.zent.test:80 so far", kClosed);
    }

    void silentNameServerCountsAsConnectTimeOut()
    {
        // Without a socket the port would be unreachable, which ends a lookup at once.
        QUdpSocket nameServer;
        QVERIFY2(nameServer.bind(QHostAddress("127.0.0.53"), 53), qPrintable(nameServer.errorString()));
        QElapsedTimer timer;
        timer.start();
        {
            Client client;
            client.failPoll("https://silent.zent.test/", "failed: no connection within 1500 ms");
            client.failPoll("https://silent.zent.test/", "not sent: no connection to silent.zent.test:443 so far");
        }
        // Discarding the client does not wait for the lookup either.
        QVERIFY2(timer.elapsed() <= 2300, qPrintable(QString::number(timer.elapsed())));
    }
};

QTEST_GUILESS_MAIN(TestHttpClient)
#include "test_httpclient.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "httpclientapi.h"
#include "lookups.h"
#include "platformcontrol.h"

#include <QNetworkProxy>
#include <QUdpSocket>

namespace
{

const QString kCa = "/etc/zent/clientapi_ca.crt";
const QString kCert = "/etc/zent/QEL_Zent.pem";
const QString kKey = "/etc/zent/.QEL_Zent.key";
const QString kTls = "/run/room/tls/";
const QString kStatusUrl = "https://server.zent.test:443/uim/v3/client/status";
/// More than a request that is not sent takes, less than any time-out.
constexpr int kAtOnceMs = 300;

/// A client with the terminal's own certificates, and its last reply.
struct Client {
    Client() { api.setSSLConfig(kCa, kCert, kKey); }
    int get(const QString& url, const QString& body = {}) { return api.getRequest(reply, url, body, true); }
    int post(const QString& url, const QString& body) { return api.postRequest(reply, url, body, true); }
    int ask(const QString& kind, const QString& url)
    {
        return kind == "get" ? get(url) : kind == "post" ? post(url, "{}") : api.pollRequest(reply, url, {});
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
        // Nothing but the server is asked.
        QNetworkProxy::setApplicationProxy(QNetworkProxy(QNetworkProxy::HttpProxy, "127.0.0.1", 9));
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
        Client client;
        client.api.setReplyTimer(20);
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

    void theThreadEndsWhenNothingIsAsked()
    {
        Client client;
        QCOMPARE(client.get(kStatusUrl), 200);
        QCOMPARE(threadsNamed("http"), 1);
        QTRY_COMPARE_WITH_TIMEOUT(threadsNamed("http"), 0, 15000);
        m_platform.addFault({{"path", "*"}}, {{"hang", true}});
        client.api.setReplyTimer(0);
        const LogCapture log;
        QCOMPARE(client.get(kStatusUrl), -QNetworkReply::TimeoutError);
        QVERIFY(log.contains("no reply within 1000 ms"));
        QElapsedTimer timer;
        timer.start();
        QVERIFY(QMetaObject::invokeMethod(qApp, "aboutToQuit"));
        QVERIFY2(timer.elapsed() < 1000, qPrintable(QString::number(timer.elapsed())));
        // The kernel lists a thread for a moment longer than it runs.
        QTRY_COMPARE(threadsNamed("http"), 0);
    }

    /// Comes last: a look-up that is not answered stays open.
    void outages_data() { fixture::addRows("outages.json"); }
    void outages()
    {
        QFETCH(QJsonObject, row);
        // Without a socket the port would be unreachable, which ends a lookup at once.
        QUdpSocket nameServer;
        nameServer.setProxy(QNetworkProxy::NoProxy);
        QVERIFY2(nameServer.bind(QHostAddress("127.0.0.53"), 53), qPrintable(nameServer.errorString()));
        auto client = std::make_unique<Client>();
        QElapsedTimer timer;
        for (const QJsonValue& step : row["steps"].toArray()) {
            for (const QJsonValue& fault : step["faults"].toArray())
                m_platform.addFault({{"path", fault["path"]}}, fault["action"].toObject());
            const LogCapture log;
            if (step["state"].isObject())
                m_platform.patchState(step["state"].toObject());
            if (step["until"].isString())
                QTRY_VERIFY_WITH_TIMEOUT(log.contains(step["until"].toString()), 10000);
            timer.start();
            fixture::compare(client->ask(step["kind"].toString("poll"), step["url"].toString(kStatusUrl)),
                             step["result"]);
            if (step["waits"].isBool())
                QCOMPARE(timer.elapsed() > kAtOnceMs, step["waits"].toBool());
            fixture::compareLog(log, step["log"]);
        }
        timer.start();
        client.reset();
        QVERIFY2(timer.elapsed() < 1000, qPrintable(QString::number(timer.elapsed())));
    }
};

QTEST_GUILESS_MAIN(TestHttpClient)
#include "test_httpclient.moc"

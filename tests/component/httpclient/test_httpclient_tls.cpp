#include "fixtures.h"
#include "logcapture.h"
#include "platformcontrol.h"
#include "testfiles.h"

#include <QTemporaryDir>
#include <QtTest>

#include <curl/curl.h>

/// Whom the client trusts, and as whom it shows itself.
class TestHttpClientTls : public QObject
{
    Q_OBJECT

private slots:
    void initTestCase();
    void init();
    void refusesUntrustedServers_data();
    void refusesUntrustedServers();
    void presentsTheClientCertificate();
    void missingFilesFail_data();
    void missingFilesFail();
    void exchangedFilesTakeEffect();

private:
    PlatformControl m_platform;
};

void TestHttpClientTls::initTestCase()
{
    QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "run this inside a room with the simulated platform");
}

void TestHttpClientTls::init()
{
    m_platform.patchState(
        {{"tls", QJsonObject{{"certificate", "server"}, {"demand_client_certificate", false}}}, {"listening", true}});
    m_platform.clearRecord();
}

void TestHttpClientTls::refusesUntrustedServers_data()
{
    QTest::addColumn<QString>("certificate");
    QTest::addColumn<QString>("ca");
    QTest::newRow("unknown authority") << QStringLiteral("other_ca") << kCa;
    QTest::newRow("other host's certificate") << QStringLiteral("wrong_host") << kCa;
    QTest::newRow("expired") << QStringLiteral("expired") << kCa;
    QTest::newRow("other authority trusted")
        << QStringLiteral("server") << QStringLiteral("/run/room/tls/unknown_ca.crt");
    QTest::newRow("no authority trusted") << QStringLiteral("server") << QString();
}

void TestHttpClientTls::refusesUntrustedServers()
{
    QFETCH(QString, certificate);
    QFETCH(QString, ca);
    m_platform.patchState({{"tls", QJsonObject{{"certificate", certificate}}}});
    Client client(ca);
    QCOMPARE(client.post(kStatusUrl, QStringLiteral("{}")), -CURLE_PEER_FAILED_VERIFICATION);
    QCOMPARE(client.reply, QString());
    QVERIFY(m_platform.record(QStringLiteral("http")).isEmpty());
}

void TestHttpClientTls::presentsTheClientCertificate()
{
    Client without(kCa, {}, {});
    Client with;
    QCOMPARE(without.get(kStatusUrl), 403);
    QCOMPARE(with.get(kStatusUrl), 200);
    m_platform.patchState({{"tls", QJsonObject{{"demand_client_certificate", true}}}});
    QVERIFY(without.get(kStatusUrl) < 0);
    QCOMPARE(with.get(kStatusUrl), 200);
    // The configuration of the same client changes.
    without.api.setSSLConfig(kCa, kCert, kKey);
    QCOMPARE(without.get(kStatusUrl), 200);
    with.api.setSSLConfig(kCa, {}, {});
    QVERIFY(with.get(kStatusUrl) < 0);
}

void TestHttpClientTls::missingFilesFail_data()
{
    QTest::addColumn<QStringList>("paths");
    QTest::addColumn<int>("result");
    const QString missing = QStringLiteral("/etc/zent/missing.pem");
    QTest::newRow("authority") << QStringList{missing, kCert, kKey} << -CURLE_SSL_CACERT_BADFILE;
    QTest::newRow("certificate") << QStringList{kCa, missing, kKey} << -CURLE_SSL_CERTPROBLEM;
    QTest::newRow("key") << QStringList{kCa, kCert, missing} << -CURLE_SSL_CERTPROBLEM;
    QTest::newRow("key of another certificate")
        << QStringList{kCa, kCert, QStringLiteral("/run/room/tls/other_client.key")} << -CURLE_SSL_CERTPROBLEM;
}

void TestHttpClientTls::missingFilesFail()
{
    QFETCH(QStringList, paths);
    QFETCH(int, result);
    const LogCapture log;
    Client client;
    QCOMPARE(client.get(kStatusUrl), 200);
    client.api.setSSLConfig(paths.at(0), paths.at(1), paths.at(2));
    QCOMPARE(client.get(kStatusUrl), result);
    QCOMPARE(log.lines().size(), 1);
}

void TestHttpClientTls::exchangedFilesTakeEffect()
{
    const QTemporaryDir directory;
    const QString ca = directory.filePath(QStringLiteral("ca.crt"));
    Client client(ca);
    QCOMPARE(client.get(kStatusUrl), -CURLE_SSL_CACERT_BADFILE);
    testfiles::write(ca, testfiles::read(kCa));
    QCOMPARE(client.get(kStatusUrl), 200);
    testfiles::write(ca, testfiles::read(QStringLiteral("/run/room/tls/unknown_ca.crt")));
    QCOMPARE(client.get(kStatusUrl), -CURLE_PEER_FAILED_VERIFICATION);
}

QTEST_GUILESS_MAIN(TestHttpClientTls)
#include "test_httpclient_tls.moc"

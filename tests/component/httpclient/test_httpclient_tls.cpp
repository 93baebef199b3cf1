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

    PlatformControl m_platform;

    void use(const QString& certificate, bool demandClientCertificate = false)
    {
        m_platform.patchState({{"tls", QJsonObject{{"certificate", certificate},
                                                   {"demand_client_certificate", demandClientCertificate}}}});
    }

private slots:
    void init()
    {
        use("server");
        m_platform.clearRecord();
    }

    void refusesUntrustedServers()
    {
        const QString unknown = "/run/room/tls/unknown_ca.crt";
        const QList<QPair<QString, QString>> cases{
            {"other_ca", kCa}, {"wrong_host", kCa}, {"expired", kCa}, {"server", unknown}, {"server", QString()}};
        for (const auto& [certificate, ca] : cases) {
            use(certificate);
            Client client(ca);
            QVERIFY2(client.post(kStatusUrl, "{}") == -CURLE_PEER_FAILED_VERIFICATION, qPrintable(certificate + ca));
            QCOMPARE(client.reply, QString());
        }
        QVERIFY(m_platform.record("http").isEmpty());
    }

    void presentsTheClientCertificate()
    {
        Client without(kCa, {}, {});
        Client with;
        QCOMPARE(without.get(kStatusUrl), 403);
        QCOMPARE(with.get(kStatusUrl), 200);
        use("server", true);
        QVERIFY(without.get(kStatusUrl) < 0);
        QCOMPARE(with.get(kStatusUrl), 200);
        // The configuration of the same client changes.
        without.api.setSSLConfig(kCa, kCert, kKey);
        QCOMPARE(without.get(kStatusUrl), 200);
        with.api.setSSLConfig(kCa, {}, {});
        QVERIFY(with.get(kStatusUrl) < 0);
    }

    void missingFilesFail()
    {
        const QString missing = "/etc/zent/missing.pem";
        const QList<QPair<QStringList, int>> cases{
            {{missing, kCert, kKey}, CURLE_SSL_CACERT_BADFILE},
            {{kCa, missing, kKey}, CURLE_SSL_CERTPROBLEM},
            {{kCa, kCert, missing}, CURLE_SSL_CERTPROBLEM},
            {{kCa, kCert, "/run/room/tls/other_client.key"}, CURLE_SSL_CERTPROBLEM},
        };
        for (const auto& [paths, error] : cases) {
            const LogCapture log;
            Client client;
            QCOMPARE(client.get(kStatusUrl), 200);
            client.api.setSSLConfig(paths.at(0), paths.at(1), paths.at(2));
            QCOMPARE(qMakePair(paths, client.get(kStatusUrl)), qMakePair(paths, -error));
            QCOMPARE(log.lines().size(), 1);
        }
    }

    void exchangedFilesTakeEffect()
    {
        const QTemporaryDir directory;
        const QString ca = directory.filePath("ca.crt");
        Client client(ca);
        QCOMPARE(client.get(kStatusUrl), -CURLE_SSL_CACERT_BADFILE);
        testfiles::write(ca, testfiles::read(kCa));
        QCOMPARE(client.get(kStatusUrl), 200);
        testfiles::write(ca, testfiles::read("/run/room/tls/unknown_ca.crt"));
        QCOMPARE(client.get(kStatusUrl), -CURLE_PEER_FAILED_VERIFICATION);
    }
};

QTEST_GUILESS_MAIN(TestHttpClientTls)
#include "test_httpclient_tls.moc"

#include "notification.h"
#include "paths.h"
#include "testfiles.h"

#include <QtTest>

#include <ctime>

class TestNotifyMessages : public QObject
{
    Q_OBJECT

private slots:
    void configurations()
    {
        const QMap<QByteArray, QString> cases = {
            {R"({"protocol": "https", "server_host": "h"})", "https://h:443"},
            {R"({"protocol": "HTTPS", "server_host": "h"})", "HTTPS://h:10080"},
            {R"({"server_host": "h", "server_port": "8080"})", "http://h:0"},
            // A place marker in a value is text.
            {R"({"server_host": "h%1", "server_port": 8080})", "http://h%1:8080"},
        };
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            testfiles::write(zent::kUserinfoPath, row.key());
            QNotification client;
            QCOMPARE(client.loadCfg(), 0);
            QCOMPARE(client.listUrl(), row.value() + "/notification/v2/list");
        }
        const auto fails = [](int result) { return QNotification().loadCfg() == result; };
        testfiles::write(zent::kUserinfoPath, R"({"protocol": "https", )");
        QVERIFY(fails(-3));
        QFile::setPermissions(zent::kUserinfoPath, {});
        QVERIFY(fails(-2));
        testfiles::remove(zent::kUserinfoPath);
        QVERIFY(fails(-1));
    }

    void times()
    {
        const QMap<QString, QString> relative = {
            {"2024-03-05T16:00:00Z", "2024/03/06 00:00"},
            {"2024-03-04T16:30:00Z", "今天 00:30"},
            {"2024-03-04T15:59:59Z", "昨天 23:59"},
            {"2024-03-03T15:59:59Z", "2024/03/03 23:59"},
            {"yesterday", ""},
        };
        // The day is the one at UTC+8 whatever the zone.
        for (const char* zone : {"UTC", "Europe/Berlin", "Pacific/Kiritimati"}) {
            qputenv("TZ", zone);
            tzset();
            for (auto row = relative.begin(); row != relative.end(); ++row)
                QCOMPARE(zent::formatServerTime(row.key(), true, QDate(2024, 3, 5)), row.value());
            // An hour that Berlin skips.
            QCOMPARE(zent::formatServerTime("2024-03-31T02:30:00Z", false, QDate()), QString("2024/03/31 10:30"));
        }
    }
};

QTEST_GUILESS_MAIN(TestNotifyMessages)
#include "test_notifymessages.moc"

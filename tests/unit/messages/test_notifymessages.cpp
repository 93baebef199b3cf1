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
        const QString unset = "http://:10080/notification/v2/list";
        const QMap<QByteArray, QString> cases = {
            {R"({"protocol": "https", "server_host": "h"})", "https://h:443/notification/v2/list"},
            {R"({"protocol": "HTTPS", "server_host": "h"})", "HTTPS://h:10080/notification/v2/list"},
            {R"({"server_host": "h", "server_port": 8080})", "http://h:8080/notification/v2/list"},
            {R"({"server_host": "h", "server_port": "8080"})", "http://h:0/notification/v2/list"},
            // A place marker in a value is text.
            {R"({"server_host": "h%1", "notificition_prefix": "/%2"})", "http://h%1:10080/%2/list"},
            {"[]", unset},
        };
        QNotification client;
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            testfiles::write(zent::kUserinfoPath, row.key());
            QCOMPARE(client.loadCfg(), 0);
            QCOMPARE(client.listUrl(), row.value());
        }
        QCOMPARE(client.readUrl() + "_all", client.readAllUrl());

        const auto fails = [&](int result) {
            QNotification fresh;
            return fresh.loadCfg() == result && fresh.listUrl() == unset;
        };
        for (const char* broken : {"", R"({"protocol": "https", )"}) {
            testfiles::write(zent::kUserinfoPath, broken);
            QVERIFY2(fails(-3), broken);
        }
        QFile::setPermissions(zent::kUserinfoPath, {});
        QVERIFY(fails(-2));
        testfiles::remove(zent::kUserinfoPath);
        QVERIFY(fails(-1));
    }

    void messageLists()
    {
        const QMap<QByteArray, QStringList> cases = {
            {R"([{"title": "b%1"}, {"title": "a"}])", {"b%1", "a"}},
            {R"([{}, {"title": 5}, 7, null, {"uuid": "u", "read_at": null}])", {"", ""}},
            {R"({"title": "x"})", {}},
            {"<html>", {}},
        };
        for (auto row = cases.begin(); row != cases.end(); ++row) {
            QStringList found;
            for (const NotifyMessage& message : zent::parseMessageList(row.key()))
                found.append(message.title);
            QCOMPARE(found, row.value());
        }
    }

    void times()
    {
        struct Row {
            const char* server;
            bool relative;
            QDate today;
            const char* shown;
        };
        const QDate march5(2024, 3, 5);
        const QList<Row> rows = {
            {"2024-03-04T16:30:00Z", false, march5, "2024/03/05 00:30"},
            {"2024-03-04T16:30:00Z", true, march5, "今天 00:30"},
            {"2024-03-04T15:59:59Z", true, march5, "昨天 23:59"},
            {"2024-03-03T15:59:59Z", true, march5, "2024/03/03 23:59"},
            {"2024-03-05T16:00:00Z", true, march5, "2024/03/06 00:00"},
            {"2024-02-29T16:00:00Z", true, QDate(2024, 3, 2), "昨天 00:00"},
            {"2023-12-31T16:00:00Z", true, QDate(2024, 1, 1), "今天 00:00"},
            // An hour that Berlin skips.
            {"2024-03-31T02:30:00Z", false, march5, "2024/03/31 10:30"},
            {"yesterday", true, march5, ""},
            {"", true, march5, ""},
        };
        for (const char* zone : {"UTC", "Europe/Berlin", "America/Los_Angeles", "Pacific/Kiritimati"}) {
            qputenv("TZ", zone);
            tzset();
            for (const Row& row : rows)
                QCOMPARE(zent::formatServerTime(row.server, row.relative, row.today), QString(row.shown));
            // The day is the one at UTC+8 whatever the zone.
            const QDateTime now = QDateTime::currentDateTimeUtc();
            const QString stamp = now.toString("yyyy-MM-ddThh:mm:ssZ");
            QVERIFY2(QNotification::formatTime(stamp, true).startsWith("今天 ") ||
                         QDateTime::currentDateTimeUtc().addSecs(28800).date() != now.addSecs(28800).date(),
                     zone);
        }
    }

    void numbers()
    {
        QCOMPARE(QNotification::formatUnReadNumber(99), QStringLiteral("99"));
        QCOMPARE(QNotification::formatUnReadNumber(100), QStringLiteral("..."));
    }
};

QTEST_GUILESS_MAIN(TestNotifyMessages)
#include "test_notifymessages.moc"

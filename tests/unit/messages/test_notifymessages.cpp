#include "notification.h"
#include "paths.h"
#include "testfiles.h"

#include <QtTest>

#include <ctime>

class TestNotifyMessages : public QObject
{
    Q_OBJECT

private slots:
    void configurations_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<int>("result");
        QTest::addColumn<QString>("url");
        QTest::newRow("https") << QByteArray(R"({"protocol": "https", "server_host": "h"})") << 0
                               << "https://h:443/notification/v2/list";
        QTest::newRow("https in capitals") << QByteArray(R"({"protocol": "HTTPS", "server_host": "h"})") << 0
                                           << "HTTPS://h:10080/notification/v2/list";
        QTest::newRow("port a number") << QByteArray(R"({"server_host": "h", "server_port": 8080})") << 0
                                       << "http://h:8080/notification/v2/list";
        QTest::newRow("port a text") << QByteArray(R"({"server_host": "h", "server_port": "8080"})") << 0
                                     << "http://h:0/notification/v2/list";
        QTest::newRow("prefix with a place marker")
            << QByteArray(R"({"server_host": "h%1", "notificition_prefix": "/%2"})") << 0 << "http://h%1:10080/%2/list";
        QTest::newRow("array") << QByteArray("[]") << 0 << "http://:10080/notification/v2/list";
        QTest::newRow("broken") << QByteArray(R"({"protocol": "https", )") << -3
                                << "http://:10080/notification/v2/list";
        QTest::newRow("empty") << QByteArray() << -3 << "http://:10080/notification/v2/list";
    }
    void configurations()
    {
        QFETCH(QByteArray, content);
        QFETCH(int, result);
        QFETCH(QString, url);
        testfiles::write(zent::kUserinfoPath, content);
        QNotification client;
        QCOMPARE(client.loadCfg(), result);
        QCOMPARE(client.listUrl(), url);
        QCOMPARE(client.readUrl() + "_all", client.readAllUrl());
    }

    void noFileAndUnreadableFile()
    {
        testfiles::remove(zent::kUserinfoPath);
        QNotification client;
        QCOMPARE(client.loadCfg(), -1);
        QCOMPARE(client.listUrl(), QStringLiteral("http://:10080/notification/v2/list"));
        testfiles::write(zent::kUserinfoPath, R"({"server_host": "h"})");
        QFile::setPermissions(zent::kUserinfoPath, {});
        QCOMPARE(client.loadCfg(), -2);
        QCOMPARE(client.listUrl(), QStringLiteral("http://:10080/notification/v2/list"));
        testfiles::remove(zent::kUserinfoPath);
    }

    void messageLists_data()
    {
        QTest::addColumn<QByteArray>("body");
        QTest::addColumn<QStringList>("titles");
        QTest::newRow("order kept") << QByteArray(R"([{"title": "b%1"}, {"title": "a"}])") << QStringList({"b%1", "a"});
        QTest::newRow("missing and odd") << QByteArray(R"([{}, {"title": 5}, 7, null])")
                                         << QStringList({"", "", "", ""});
        QTest::newRow("object") << QByteArray(R"({"title": "x"})") << QStringList();
        QTest::newRow("empty") << QByteArray() << QStringList();
        QTest::newRow("html") << QByteArray("<html>") << QStringList();
    }
    void messageLists()
    {
        QFETCH(QByteArray, body);
        QFETCH(QStringList, titles);
        QStringList found;
        for (const NotifyMessage& message : zent::parseMessageList(body))
            found.append(message.title);
        QCOMPARE(found, titles);
    }

    void times_data()
    {
        QTest::addColumn<QString>("server");
        QTest::addColumn<bool>("relative");
        QTest::addColumn<QDate>("today");
        QTest::addColumn<QString>("shown");
        const QDate march5(2024, 3, 5);
        QTest::newRow("across midnight") << "2024-03-04T16:30:00Z" << false << march5 << "2024/03/05 00:30";
        QTest::newRow("today") << "2024-03-04T16:30:00Z" << true << march5 << "今天 00:30";
        QTest::newRow("last minute of yesterday") << "2024-03-04T15:59:59Z" << true << march5 << "昨天 23:59";
        QTest::newRow("older") << "2024-03-03T15:59:59Z" << true << march5 << "2024/03/03 23:59";
        QTest::newRow("to come") << "2024-03-05T16:00:00Z" << true << march5 << "2024/03/06 00:00";
        QTest::newRow("month end") << "2024-02-29T16:00:00Z" << true << QDate(2024, 3, 2) << "昨天 00:00";
        QTest::newRow("year end") << "2023-12-31T16:00:00Z" << true << QDate(2024, 1, 1) << "今天 00:00";
        QTest::newRow("hour that Berlin skips") << "2024-03-31T02:30:00Z" << false << march5 << "2024/03/31 10:30";
        QTest::newRow("no time") << "yesterday" << true << march5 << "";
        QTest::newRow("empty") << "" << true << march5 << "";
    }
    void times()
    {
        QFETCH(QString, server);
        QFETCH(bool, relative);
        QFETCH(QDate, today);
        QFETCH(QString, shown);
        for (const char* zone :
             {"UTC", "Europe/Berlin", "America/Los_Angeles", "Asia/Shanghai", "Pacific/Kiritimati"}) {
            qputenv("TZ", zone);
            tzset();
            QVERIFY2(zent::formatServerTime(server, relative, today) == shown, zone);
            // The day is the one at UTC+8 whatever the zone.
            const QDateTime now = QDateTime::currentDateTimeUtc();
            const QString stamp = now.toString("yyyy-MM-ddThh:mm:ssZ");
            QVERIFY2(QNotification::formatTime(stamp, true).startsWith(QStringLiteral("今天 ")) ||
                         QDateTime::currentDateTimeUtc().addSecs(28800).date() != now.addSecs(28800).date(),
                     zone);
        }
    }

    void numbers()
    {
        QCOMPARE(QNotification::formatUnReadNumber(99), QStringLiteral("99"));
        QCOMPARE(QNotification::formatUnReadNumber(100), QStringLiteral("..."));
    }

    void waitLetsEventsThrough()
    {
        int ticks = 0;
        QTimer timer;
        connect(&timer, &QTimer::timeout, this, [&ticks] { ++ticks; });
        timer.start(10);
        QElapsedTimer clock;
        clock.start();
        QNotification::msleep(200);
        // A wait that begins right before midnight ends at once.
        if (QTime::currentTime() > QTime(0, 0, 1)) {
            QVERIFY(clock.elapsed() >= 195);
            QVERIFY(ticks >= 5);
        }
    }
};

QTEST_GUILESS_MAIN(TestNotifyMessages)
#include "test_notifymessages.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "notification.h"
#include "platformcontrol.h"
#include "unreadpoll.h"

#include <QNetworkAccessManager>
#include <QSignalSpy>

#include <ctime>

class TestMessages : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    const QString m_user = QStringLiteral("zhangsan");
    const QJsonObject m_list{{"path", "/notification/v2/list"}};

private slots:
    void initTestCase() { QNotification::qInstance = new QNotification(this); }
    void init() { m_platform.clearFaults(); }

    void countIsAnnouncedOncePerChange()
    {
        int count = 0;
        UnreadPoll poll(m_user, count);
        QSignalSpy announced(&poll, &UnreadPoll::newMessage);
        QStringList texts;
        connect(&poll, &UnreadPoll::textChanged, this, [&texts](const QString& text) { texts += text; });
        struct {
            int unread;
            bool fails;
            int announced;
        } const polls[] = {{2, false, 1}, {2, false, 1}, {5, true, 1}, {0, false, 1}, {150, false, 2}};
        for (const auto& row : polls) {
            m_platform.setUnread(row.unread);
            if (row.fails)
                m_platform.addFault(m_list, {{"status", 500}});
            // Polls within one second share their URL and thus their callback.
            QTest::qWait(1001 - QTime::currentTime().msec());
            poll.unreadMessages();
            QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
            m_platform.clearFaults();
            QCOMPARE(announced.count(), row.announced);
        }
        QCOMPARE(count, 150);
        count = 2;
        for (int i = 0; i < 3; ++i)
            poll.readOneUnreadMessage();
        QCOMPARE(count, 0);
        count = 4;
        poll.readAllUnreadMessages();
        QCOMPARE(count, 0);
        QCOMPARE(texts, QStringList({"未读消息(2)", "未读消息(2)", "未读消息(...)", "未读消息(1)", "全部消息",
                                     "全部消息", "全部消息"}));
    }

    void pollsGoOn()
    {
        m_platform.setUnread(3);
        int count = 0;
        QList<QPair<int, int>> intervals;
        auto poll = std::make_unique<UnreadPoll>(m_user, count, nullptr, [&intervals](int latest, int earliest) {
            intervals.append({latest, earliest});
            return 600;
        });
        QSignalSpy announced(poll.get(), &UnreadPoll::newMessage);
        poll->start();
        // The first answer is not announced.
        QTRY_COMPARE(count, 3);
        QVERIFY(announced.isEmpty());
        QTRY_VERIFY(intervals.size() >= 4);
        QCOMPARE(intervals.mid(0, 3), (QList<QPair<int, int>>{{3000, 1000}, {180000, 60000}, {180000, 60000}}));
        // It may go while an answer is awaited.
        m_platform.addFault(m_list, {{"delay_ms", 300}});
        poll->unreadMessages();
        poll.reset();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
    }

    void configurations_data() { fixture::addRows("notificationaddresses.json"); }
    void configurations()
    {
        QFETCH(QJsonObject, row);
        QNotification client;
        // One for each kind of request, from the start.
        QCOMPARE(client.findChildren<QNetworkAccessManager*>().size(), 3);
        testfiles::remove(testfiles::kInfoFile);
        if (row.contains("file"))
            testfiles::write(testfiles::kInfoFile, row["file"].toString().toUtf8());
        if (row["unreadable"].toBool())
            QFile::setPermissions(testfiles::kInfoFile, {});
        const LogCapture log;
        fixture::compare(client.loadCfg(), row["result"].toInt());
        fixture::compare(client.listUrl(), row["list"]);
        fixture::compareLog(log, row["log"]);
    }

    void times()
    {
        // The day is the one at UTC+8 whatever the zone.
        for (const char* zone : {"UTC", "Europe/Berlin", "Pacific/Kiritimati"}) {
            qputenv("TZ", zone);
            tzset();
            const QJsonObject relative = fixture::read("relativetimes.json");
            QJsonObject got;
            for (const QString& time : relative.keys())
                got[time] = zent::formatServerTime(time, true, QDate(2024, 3, 5));
            fixture::compare(got, relative);
            // An hour that Berlin skips.
            QCOMPARE(zent::formatServerTime("2024-03-31T02:30:00Z", false, QDate()), QString("2024/03/31 10:30"));
        }
    }
};

QTEST_GUILESS_MAIN(TestMessages)
#include "test_messages.moc"

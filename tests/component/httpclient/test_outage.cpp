#include "fixtures.h"
#include "logcapture.h"
#include "platformcontrol.h"

#include <QUdpSocket>
#include <QtTest>

#include <curl/curl.h>

namespace
{

constexpr int kTimedOut = -CURLE_OPERATION_TIMEDOUT;
/// More than a request that is not sent takes, less than any time-out.
constexpr int kAtOnceMs = 300;

} // namespace

/// What polls and a person's requests cost while a host does not answer, and how that ends.
class TestOutage : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;

    /// Whether a GET was not sent, with the result of the time-out before and one log line that says so.
    static bool heldBack(Client& client, const QString& url)
    {
        const LogCapture log;
        client.reply = "from before";
        return client.get(url) == kTimedOut && client.elapsedMs < kAtOnceMs && client.reply.isEmpty() &&
               log.lines().size() == 1 && log.contains("not sent");
    }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.patchState({{"black_hole", false}, {"listening", true}});
        m_platform.clearRecord();
    }

    void unreachableHostIsTriedInTheBackground_data()
    {
        QTest::addColumn<QJsonObject>("change");
        QTest::addColumn<int>("result");
        QTest::newRow("answers again") << QJsonObject{{"black_hole", false}} << 200;
        QTest::newRow("refuses") << QJsonObject{{"black_hole", false}, {"listening", false}} << -CURLE_COULDNT_CONNECT;
    }
    void unreachableHostIsTriedInTheBackground()
    {
        QFETCH(QJsonObject, change);
        QFETCH(int, result);
        m_platform.patchState({{"black_hole", true}});
        Client client;
        QCOMPARE(client.get(kStatusUrl), kTimedOut);
        QVERIFY(client.elapsedMs > kAtOnceMs);
        QElapsedTimer outage;
        outage.start();
        QVERIFY(heldBack(client, kStatusUrl));
        // Another port of the same host stands for itself.
        QCOMPARE(client.get("http://server.zent.test/none"), kTimedOut);
        QVERIFY(client.elapsedMs > kAtOnceMs);

        // The first try, after 2 s, fails; the next one follows 4 s later.
        QTest::qWait(static_cast<int>(3800 - outage.elapsed()));
        const LogCapture log;
        m_platform.patchState(change);
        QTest::qWait(static_cast<int>(5200 - outage.elapsed()));
        QVERIFY(heldBack(client, kStatusUrl));
        QTRY_VERIFY_WITH_TIMEOUT(log.contains("server.zent.test:443 answers again"), 10000);
        QVERIFY(m_platform.record("http").isEmpty());
        for (int i = 0; i < 2; ++i)
            QCOMPARE(client.get(kStatusUrl), result);
    }

    void postIsAlwaysSentAndItsAnswerEndsTheOutage()
    {
        m_platform.patchState({{"black_hole", true}});
        Client client;
        const auto post = [&client] { return client.post(kServer + "/uim/v3/client/join", "{}"); };
        for (int i = 0; i < 2; ++i) {
            QCOMPARE(post(), kTimedOut);
            QVERIFY(client.elapsedMs > kAtOnceMs);
            QVERIFY(heldBack(client, kStatusUrl));
        }
        m_platform.patchState({{"black_hole", false}});
        QVERIFY(heldBack(client, kStatusUrl));
        QCOMPARE(post(), 200);
        QCOMPARE(client.get(kStatusUrl), 200);
    }

    void openConnectionThatFallsSilent()
    {
        Client client;
        QCOMPARE(client.get(kStatusUrl), 200);
        m_platform.patchState({{"black_hole", true}});
        QCOMPARE(client.get(kStatusUrl), kTimedOut);
        const LogCapture log;
        QCOMPARE(client.get(kStatusUrl), kTimedOut);
        QVERIFY2(log.contains("gave no reply in time"), qPrintable(log.lines().join('\n')));
    }

    void replyTimeOutsHoldPollsBackEverLonger()
    {
        const QString slow = kServer + "/slow";
        m_platform.addFault({{"path", "/slow"}}, {{"hang", true}});
        Client client;
        client.api.setReplyTimer(1);
        for (const int period : {2000, 4000}) {
            QCOMPARE(client.get(slow), kTimedOut);
            QVERIFY(client.elapsedMs > kAtOnceMs);
            QElapsedTimer hold;
            hold.start();
            QTest::qWait(period - 500);
            QVERIFY(heldBack(client, kStatusUrl));
            QTest::qWait(static_cast<int>(period + 100 - hold.elapsed()));
        }
        // The first good reply puts the period back.
        QCOMPARE(client.get(kStatusUrl), 200);
        QCOMPARE(client.get(slow), kTimedOut);
        QTest::qWait(2100);
        QCOMPARE(client.get(kStatusUrl), 200);
    }

    void silentNameServerCountsAsConnectTimeOut()
    {
        // Without a socket the port would be unreachable, which ends a lookup at once.
        QUdpSocket nameServer;
        QVERIFY2(nameServer.bind(QHostAddress("127.0.0.53"), 53), qPrintable(nameServer.errorString()));
        const QString url = "https://silent.zent.test/";
        QElapsedTimer timer;
        timer.start();
        {
            Client client;
            const int result = client.get(url);
            QVERIFY2(result < 0 && client.elapsedMs >= 950, "the lookup was not answered by silence");
            QCOMPARE(client.get(url), result);
            QVERIFY(client.elapsedMs < kAtOnceMs);
        }
        // Discarding the client does not wait for the lookup either.
        QVERIFY2(timer.elapsed() <= 2300, qPrintable(QString::number(timer.elapsed())));
    }
};

QTEST_GUILESS_MAIN(TestOutage)
#include "test_outage.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "httprules.h"
#include "lookups.h"
#include "private/hostguard.h"

#include <QNetworkProxy>
#include <QTcpSocket>

namespace
{

/// How long each timer of the guard that runs does so, shortest first.
QList<int> running(const HostGuard& guard)
{
    QList<int> intervals;
    for (const QTimer* timer : guard.findChildren<QTimer*>()) {
        if (timer->isActive())
            intervals.append(timer->interval());
    }
    std::sort(intervals.begin(), intervals.end());
    return intervals;
}

} // namespace

class TestHostGuard : public QObject
{
    Q_OBJECT

private slots:
    void initTestCase()
    {
        const QStringList paths = QCoreApplication::libraryPaths();
        zent::http::leaveOutBearers();
        QCOMPARE(QCoreApplication::libraryPaths(), paths);
    }

    /// Milliseconds of polls that were answered, or what came instead.
    void pollsAreHeldBackFor_data() { fixture::addRows("heldbackpolls.json"); }
    void pollsAreHeldBackFor()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        HostGuard guard("server", 443);
        for (const QJsonValue& poll : row["polls"].toArray()) {
            guard.note(poll == "no connection" ? HostGuard::Outcome::ConnectTimedOut
                       : poll == "no reply"    ? HostGuard::Outcome::ReplyTimedOut
                       : poll == "met"         ? HostGuard::Outcome::Met
                       : poll == "unknown"     ? HostGuard::Outcome::Unknown
                                               : HostGuard::Outcome::Answered,
                       7);
            if (poll != "met" && poll != "unknown")
                guard.notePollTime(std::chrono::milliseconds(poll.toInt(1900)), 8);
        }
        const QString objection = guard.objection();
        QCOMPARE(objection, row["objection"].toString());
        QCOMPARE(running(guard), objection.startsWith("no connection") ? QList<int>{2000} : QList<int>());
        if (!objection.isEmpty())
            QCOMPARE(guard.failure(), row["failure"].toInt());
        fixture::compareLog(log, row["log"]);
    }

    void unreachableHostIsTriedLessAndLess()
    {
        // No packet is sent there.
        HostGuard guard("255.255.255.255", 1);
        guard.note(HostGuard::Outcome::ConnectTimedOut, 7);
        for (const int interval : {2000, 4000, 8000, 16000, 30000, 30000}) {
            // Another time-out changes nothing.
            guard.note(HostGuard::Outcome::ConnectTimedOut, 7);
            QList<QTimer*> timers = guard.findChildren<QTimer*>();
            if (timers[0]->interval() != interval)
                std::swap(timers[0], timers[1]);
            QCOMPARE(timers[0]->interval(), interval);
            QVERIFY(QMetaObject::invokeMethod(timers[0], "timeout"));
            QCOMPARE(running(guard), QList<int>({1500, std::min(2 * interval, 30000)}));
            // An address is not looked up first; the attempt has its time.
            QCOMPARE(guard.findChildren<QTcpSocket*>().size(), 1);
            QVERIFY(QMetaObject::invokeMethod(timers[1], "timeout"));
            QCOMPARE(running(guard), QList<int>({std::min(2 * interval, 30000)}));
            QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
            QCOMPARE(guard.children().size(), 2);
        }
        QCOMPARE(guard.objection(), QString("no connection to 255.255.255.255:1 so far"));
    }

    void aRefusalShowsThatTheHostIsThere()
    {
        QNetworkProxy::setApplicationProxy(QNetworkProxy(QNetworkProxy::HttpProxy, "127.0.0.1", 9));
        // Nobody listens there.
        HostGuard guard("127.0.0.1", 1);
        guard.note(HostGuard::Outcome::ConnectTimedOut, 7);
        QVERIFY(!guard.objection().isEmpty());
        QTRY_COMPARE(guard.objection(), QString());
        QCOMPARE(running(guard), QList<int>());
    }

    void lookUpsAreCounted()
    {
        zent::http::noteLookup("127.0.0.1");
        zent::http::noteLookup("::1");
        QVERIFY(!zent::http::mayBeLookingUp());
        const auto first = zent::http::noteLookup("server.zent.test");
        const auto second = zent::http::noteLookup("server.zent.test");
        for (const auto& end : {first, first, second}) {
            QVERIFY(zent::http::mayBeLookingUp());
            end();
        }
        QVERIFY(!zent::http::mayBeLookingUp());
    }
};

QTEST_GUILESS_MAIN(TestHostGuard)
#include "test_hostguard.moc"

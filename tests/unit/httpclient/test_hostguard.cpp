// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "lookups.h"
#include "private/hostguard.h"

class TestHostGuard : public QObject
{
    Q_OBJECT

private slots:
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
                guard.notePollTime(std::chrono::milliseconds(poll.toInt(2000)), 7);
        }
        QCOMPARE(guard.objection(), row["objection"].toString());
        QVERIFY(guard.objection().isEmpty() || guard.failure() == 7);
        fixture::compareLog(log, row["log"]);
    }

    void aRefusalShowsThatTheHostIsThere()
    {
        // Nobody listens there.
        HostGuard guard("127.0.0.1", 1);
        guard.note(HostGuard::Outcome::ConnectTimedOut, 7);
        QVERIFY(!guard.objection().isEmpty());
        QTRY_COMPARE(guard.objection(), QString());
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

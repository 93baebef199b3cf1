// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
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
        HostGuard guard("server", 443);
        for (const QJsonValue& poll : row["polls"].toArray()) {
            guard.note(poll == "no connection" ? HostGuard::Outcome::ConnectTimedOut
                       : poll == "no reply"    ? HostGuard::Outcome::ReplyTimedOut
                                               : HostGuard::Outcome::Answered,
                       7);
            guard.notePollTime(std::chrono::milliseconds(poll.toInt(2000)), 7);
        }
        QCOMPARE(guard.objection(), row["objection"].toString());
        QVERIFY(guard.objection().isEmpty() || guard.failure() == 7);
    }
};

QTEST_GUILESS_MAIN(TestHostGuard)
#include "test_hostguard.moc"

// SPDX-License-Identifier: Apache-2.0
#include "account.h"
#include "fixture.h"
#include "httprequest.h"
#include "loginname.h"
#include "platformcontrol.h"

#include <QSignalSpy>
#include <QTimer>

#include <dlfcn.h>
#include <pwd.h>

static int s_lookups = 0;

/// Stands before the one of the C library, and counts.
extern "C" passwd* getpwuid(uid_t uid)
{
    ++s_lookups;
    static const auto next = reinterpret_cast<decltype(&getpwuid)>(dlsym(RTLD_NEXT, "getpwuid"));
    return next(uid);
}

class TestAccount : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    QList<QPair<int, int>> m_intervals;

    /// Takes down the interval asked for and makes it short.
    zent::RandomInterval soon()
    {
        return [this](int latest, int earliest) {
            m_intervals.append({latest, earliest});
            return 50;
        };
    }

private slots:
    void cleanup()
    {
        m_platform.clearFaults();
        m_intervals.clear();
    }

    void theLoginNameIsLookedUpOnce()
    {
        Account account(nullptr, soon());
        for (int poll = 0; poll < 3; ++poll)
            account.getusrInfo();
        QCOMPARE(sessionLoginName(), QString("zhangsan"));
        QCOMPARE(s_lookups, 1);
    }

    void pollingEndsWithTheFirstGoodAnswer()
    {
        for (const char* path : {"account", "uim_department/id"})
            m_platform.addFault({{"path", QString("/uim/v3/client/") + path}}, {{"body", R"({"code": 1})"}});
        Account account(nullptr, soon());
        account.start();
        const auto polls = [&account] {
            QList<int> intervals;
            for (QTimer* timer : account.findChildren<QTimer*>()) {
                if (timer->isActive())
                    intervals.append(timer->interval());
                timer->setInterval(50);
            }
            return intervals;
        };
        QCOMPARE(polls(), QList<int>({2000, 3000}));
        HttpRequest* client = HttpRequest::GetInstance();
        QSignalSpy users(client, &HttpRequest::sigUserInfo);
        QSignalSpy organisations(client, &HttpRequest::sigCompanyName);
        QSignalSpy userChanges(&account, &Account::userChanged);
        QSignalSpy organisationChanges(&account, &Account::organisationChanged);
        QTRY_VERIFY(users.count() >= 2 && organisations.count() >= 2);
        QVERIFY(userChanges.isEmpty() && organisationChanges.isEmpty());
        // The body alone decides, and a later bad answer takes nothing away.
        client->onUserInfo(500, R"({"code": 0, "data": {"user": {"gecos": "A,,,1", "client_name": "PC", "id": 7}}})");
        QCOMPARE(polls(), QList<int>{50});
        client->onCompanyName(500, R"({"code": 0, "data": {"name": "O"}})");
        QCOMPARE(polls(), QList<int>());
        client->onUserInfo(200, R"({"code": 1})");
        client->onCompanyName(200, R"({"code": 1})");
        QCOMPARE(userChanges.count(), 1);
        QCOMPARE(organisationChanges.count(), 1);
        const TLoginInfo info = account.loginInfo();
        fixture::compare(QJsonArray{info.terminalAlias, info.organizationName, info.personName, info.jobNumber,
                                    info.department, account.id()},
                         QJsonArray{"PC", "O", "A", "1", "", 7});
        QVERIFY(m_intervals.isEmpty());
    }

    void otherReplies_data() { fixture::addRows("accountreplies.json"); }
    void otherReplies()
    {
        QFETCH(QJsonObject, row);
        m_platform.addFault({{"path", "/any"}}, row["reply"].toObject());
        Account account(nullptr, soon());
        QJsonArray told;
        connect(&account, &Account::userChanged, [&] { told.append("user " + account.loginInfo().personName); });
        connect(&account, &Account::organisationChanged,
                [&] { told.append("organisation " + account.loginInfo().organizationName); });
        connect(&account, &Account::areaKnown, [&] { told.append("area"); });
        connect(&account, &Account::areaFailed, [&] { told.append("failed"); });
        QNetworkAccessManager manager;
        QSignalSpy finished(&manager, &QNetworkAccessManager::finished);
        QNetworkReply* reply = manager.get(QNetworkRequest(QUrl("http://server.zent.test/any")));
        QTRY_COMPARE(finished.count(), 1);
        const LogCapture log;
        row["of"] == "area" ? account.rcvAreainfoData(reply) : account.analysejson(reply);
        fixture::compare(told, row["told"]);
        QCOMPARE(m_intervals.size(), row["refreshed"].toBool() ? 1 : 0);
        QVERIFY(m_intervals.isEmpty() || m_intervals.first() == qMakePair(900000, 600000));
        fixture::compareLog(log, row["log"]);
    }

    void administrators()
    {
        const QString file = qEnvironmentVariable("ROOM") + "/standin/id.stdout";
        for (const char* groups : {"1(sudo),2(my-zent)", "1(sudo)", "2(zent)", ""}) {
            testfiles::write(file, groups);
            Account account;
            // The first answer comes from the run that was started early, the second from one of its own.
            for (int i = 0; i < 2; ++i)
                QCOMPARE(account.isAdminUser(), QString(groups).contains(','));
        }
        QFile::remove(file);
    }
};

QTEST_GUILESS_MAIN(TestAccount)
#include "test_account.moc"

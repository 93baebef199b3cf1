// SPDX-License-Identifier: Apache-2.0
#include "account.h"
#include "fixture.h"
#include "httprequest.h"
#include "loginname.h"
#include "notification.h"
#include "platformcontrol.h"
#include "scenes.h"
#include "timelimits.h"
#include "unreadpoll.h"

#include <QNetworkAccessManager>

#include <ctime>
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

using Intervals = QList<QPair<int, int>>;

/// What is asked for over and over: the account, the scenes and the unread messages.
class TestPolls : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    const QString m_user = QStringLiteral("zhangsan");
    const QJsonObject m_list{{"path", "/notification/v2/list"}};
    Intervals m_intervals;

    /// Takes down the interval asked for and makes it short.
    zent::RandomInterval soon(int milliseconds = 1)
    {
        return [this, milliseconds](int latest, int earliest) {
            m_intervals.append({latest, earliest});
            return milliseconds;
        };
    }

private slots:
    void initTestCase() { QNotification::qInstance = new QNotification(this); }
    void init()
    {
        m_platform.clearFaults();
        m_intervals.clear();
    }

    void theLoginNameIsLookedUpOnce()
    {
        Account account(nullptr);
        for (int poll = 0; poll < 3; ++poll)
            account.getusrInfo();
        QCOMPARE(sessionLoginName(), m_user);
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
        QSignalSpy users(client, &HttpRequest::sigUserInfo), organisations(client, &HttpRequest::sigCompanyName);
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
    }

    void otherReplies_data() { fixture::addRows("accountreplies.json"); }
    void otherReplies()
    {
        QFETCH(QJsonObject, row);
        m_platform.addFault({{"path", "/any"}}, row["reply"].toObject());
        Account account(nullptr, soon(50));
        QJsonArray told;
        connect(&account, &Account::userChanged, [&] { told.append("user " + account.loginInfo().personName); });
        connect(&account, &Account::organisationChanged,
                [&] { told.append("organisation " + account.loginInfo().organizationName); });
        connect(&account, &Account::areaKnown, [&] { told.append("area"); });
        connect(&account, &Account::areaFailed, [&] { told.append("failed"); });
        QNetworkAccessManager manager;
        QNetworkReply* reply = manager.get(QNetworkRequest(QUrl("http://server.zent.test/any")));
        QTRY_VERIFY(reply->isFinished());
        const LogCapture log;
        row["of"] == "area" ? account.rcvAreainfoData(reply) : account.analysejson(reply);
        fixture::compare(told, row["told"]);
        QCOMPARE(m_intervals, row["refreshed"].toBool() ? Intervals({{900000, 600000}}) : Intervals());
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
    }

    void listsOfScenesAddUp()
    {
        const QString file = QString("/home/%1/.cache/vantor/CurrentScene").arg(m_user);
        zent::Terminal terminal;
        Scenes scenes(terminal, m_user, nullptr);
        QStringList told;
        connect(&scenes, &Scenes::choiceChanged, [&](bool offered) { told += offered ? "choice" : "no choice"; });
        connect(&scenes, &Scenes::namesAdded, [&](const QStringList& names) { told += names; });
        connect(&scenes, &Scenes::selected, [&](int index) { told += QString::number(index); });
        scenes.reverseEvn();
        QCOMPARE(scenes.currentCode(), QString("intranet-scene"));
        // A second choice adds its scenes and selects nothing.
        const QStringList lists[] = {{"a"}, {"b", "c"}, {"a", "d"}};
        for (const QStringList& names : lists) {
            QJsonArray list;
            for (const QString& name : names)
                list.append(QJsonObject{{"scene_name", name}, {"scene_code", "code-" + name}});
            QByteArray body = QJsonDocument(QJsonObject{{"code", 0}, {"message", list}}).toJson();
            QCOMPARE(scenes.analyseEvnData(&body), 1);
        }
        QCOMPARE(told, QStringList({"no choice", "choice", "b", "c", "0", "a", "d"}));
        QCOMPARE(scenes.count(), 5);
        // The first of a name counts.
        QCOMPARE(scenes.getEvncode("a"), 0);
        testfiles::write(file, "a long text from before");
        scenes.switchUserEvn("c");
        scenes.switchUserEvn("unknown");
        QCOMPARE(testfiles::read(file), QByteArray("code-c"));
        QCOMPARE(scenes.currentCode(), QString("code-c"));
        // Back in the box, where the first scene of the list is the third.
        scenes.reverseEvn();
        scenes.startWithFirst();
        scenes.reverseEvn();
        QCOMPARE(told.mid(7), QStringList({"1", "2"}));
    }

    void scenesAreAskedAgain_data() { fixture::addRows("sceneanswers.json"); }
    void scenesAreAskedAgain()
    {
        QFETCH(QJsonObject, row);
        zent::Terminal terminal;
        terminal.read();
        Scenes scenes(terminal, m_user, nullptr, soon());
        scenes.start();
        const LogCapture log;
        m_platform.addFault({{"path", "/api/client/area/scenes"}}, row["reply"].toObject());
        const int limits = singleShots(30000);
        scenes.getAllUserEnvironment();
        QCOMPARE(singleShots(30000) - limits, 1);
        QTRY_VERIFY2(log.contains(row["line"].toString()), qPrintable(log.lines().join('\n')));
        QCOMPARE(m_intervals.contains({180000, 60000}), row["again"].toBool());
        // The policy is loaded once, although its time passes over and over.
        QCOMPARE(m_intervals.first(), qMakePair(60000, 30000));
        QCOMPARE(log.count("Call loadpolicy -1"), 1);
        fixture::findInLog(log, row["log"]);
        m_platform.clearFaults();
        if (row["again"].toBool())
            QTRY_COMPARE(scenes.count(), 3);
    }

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
        auto poll = std::make_unique<UnreadPoll>(m_user, count, nullptr, soon(600));
        QSignalSpy announced(poll.get(), &UnreadPoll::newMessage);
        poll->start();
        // The first answer is not announced.
        QTRY_COMPARE(count, 3);
        QVERIFY(announced.isEmpty());
        QTRY_VERIFY(m_intervals.size() >= 4);
        QCOMPARE(m_intervals.mid(0, 3), Intervals({{3000, 1000}, {180000, 60000}, {180000, 60000}}));
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
        QElapsedTimer waited;
        waited.start();
        QNotification::msleep(250);
        QVERIFY(waited.elapsed() >= 240);
    }
};

QTEST_GUILESS_MAIN(TestPolls)
#include "test_polls.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fileconfig.h"
#include "fixture.h"
#include "httprequest.h"
#include "notification.h"
#include "pcnamerules.h"
#include "platformcontrol.h"
#include "timelimits.h"

#include <QSslConfiguration>

#include <ctime>

using namespace std::chrono_literals;

namespace
{

const QString kName = QStringLiteral("张 三&x=1");
const NotifyMessageOption kOption{kName, true, 7, 5, "a+b", "0"};
const QString kPassword = QStringLiteral("Pass\"word\\ 密");

/// The status and reply that no server would give by itself.
const QJsonObject kReply{{"status", 207},
                         {"body", QStringLiteral("die Antwort 答复")},
                         {"headers", QJsonObject{{"Set-Cookie", "a=b; Path=/"}}}};

} // namespace

/// Every request of the management and the notification service, byte for byte, and what is made of the replies.
class TestRequests : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    HttpRequest* m_server = HttpRequest::GetInstance();
    std::unique_ptr<QNotification> m_messages;
    /// Name, status and text of each signal since the last call.
    QJsonArray m_signals;

    const QMap<QString, std::function<void()>> m_calls = {
        {"getCaCert", [this] { m_server->getCaCert("server.zent.test", "80"); }},
        {"getMacheineCheck join", [this] { m_server->getMacheineCheck(MachineState::Join, kName); }},
        {"getMacheineCheck remove", [this] { m_server->getMacheineCheck(MachineState::Remove, kName); }},
        {"getMacheineCheck other", [this] { m_server->getMacheineCheck(static_cast<MachineState>(2), kName); }},
        {"postCheckAccountPwd", [this] { m_server->postCheckAccountPwd(kName, kPassword); }},
        {"postJoinControl", [this] { m_server->postJoinControl(kName); }},
        {"postQuitControl", [this] { m_server->postQuitControl(kName); }},
        {"postRemoveStatus", [this] { m_server->postRemoveStatus(kName, kPassword); }},
        {"getCompanyName", [this] { m_server->getCompanyName(); }},
        {"getUserInfo", [this] { m_server->getUserInfo(kName); }},
        {"getNotifyMessageList defaults", [this] { m_messages->getNotifyMessageList(NotifyMessageOption(), {}); }},
        {"getNotifyMessageList option", [this] { m_messages->getNotifyMessageList(kOption, {}); }},
        {"getNotifyMessageList page 0", [this] { m_messages->getNotifyMessageList(kName, true, 0, 20, {}); }},
        {"getNotifyMessageList page 1", [this] { m_messages->getNotifyMessageList(kName, true, 1, 20, {}); }},
        {"getNotifyMessageList page 3", [this] { m_messages->getNotifyMessageList(kName, false, 3, 20, {}); }},
        {"readNotifyMessage", [this] { m_messages->readNotifyMessage("u\"1", {}); }},
        {"readAllNotifyMessage", [this] { m_messages->readAllNotifyMessage(kName, {}); }},
    };

    Q_INVOKABLE void note(const int& status, const QString& text)
    {
        const QString name = m_server->metaObject()->method(senderSignalIndex()).name();
        m_signals.append(QString("%1 %2 %3").arg(name).arg(status).arg(text));
    }

private slots:
    void initTestCase()
    {
        const QMetaObject* server = m_server->metaObject();
        const QMetaMethod noted = metaObject()->method(metaObject()->indexOfMethod("note(int,QString)"));
        for (int i = server->methodOffset(); i < server->methodCount(); ++i) {
            if (server->method(i).methodType() == QMetaMethod::Signal)
                connect(m_server, server->method(i), this, noted);
        }
        testfiles::write(testfiles::kMachineFile, " M 1&2\n");
        testfiles::write(testfiles::kInfoFile, R"({"protocol": "https", "server_host": "server.zent.test",
            "server_port": 80, "notificition_prefix": "/box/v9", "token": "to ken"})");
        m_messages = std::make_unique<QNotification>();
        FileConfig* config = FileConfig::GetInstance();
        config->setServerHost("server.zent.test");
        config->setDomainHost("domain.zent.test");
        config->setDomainPort("80");
        config->setTerminalName(QStringLiteral("终端 1"));
    }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_signals = {};
    }

    void requests_data() { fixture::addRows("requests.json"); }
    void requests()
    {
        QFETCH(QJsonObject, row);
        m_platform.addFault({{"path", "*"}}, kReply);
        // Of two polls at one place the second is held back where a busy machine answers the first late.
        FileConfig::GetInstance()->setServerPort(row["port"].toString("443"));
        const LogCapture log;
        const int limits = singleShots(30000);
        m_calls[QTest::currentDataTag()]();
        // What nobody waits for ends by itself.
        QCOMPARE(singleShots(30000) - limits, m_messages->pendingRequests());
        QTRY_COMPARE(m_platform.record("http").size(), 1);
        const QJsonObject sent = m_platform.record("http").first();
        const auto text = [&sent](const char* key) { return sent[key].toString(); };
        QStringList lines{text("method") + ' ' + text("scheme") + ' ' + text("path") + '?' + text("raw_query")};
        for (const char* header :
             {"host", "content-type", "accept-encoding", "cookie", "x-xsrf-token", "x-lumo-version"})
            lines.append(QString("%1: %2").arg(header, sent["headers"].toObject()[header].toString()));
        fixture::compareLines(lines << text("body"), row["sent"]);
        fixture::compare(m_signals, row["signals"]);
        QTRY_COMPARE(m_messages->pendingRequests(), 0);
        fixture::compareLog(log, row["log"]);
    }
    void everyRequestHasARow() { QCOMPARE(fixture::read("requests.json").keys(), m_calls.keys()); }

    void messageLists_data() { fixture::addRows("messagelists.json"); }
    void messageLists()
    {
        QFETCH(QJsonObject, row);
        m_platform.addFault({{"path", "*"}}, row["reply"].toObject());
        m_messages->setTimeLimit(row["reply"].toObject()["hang"].toBool() ? 300ms : zent::http::kBackgroundTime);
        QJsonObject got;
        NotifyMessageOption option;
        option.is_not_read = row["is_not_read"].toBool();
        const LogCapture log;
        m_messages->getNotifyMessageList(option, [&got](bool ok, const NotifyMessageResponse& response) {
            QJsonArray messages;
            for (const NotifyMessage& m : response.messages)
                messages.append(QJsonArray{m.uuid, m.uid, m.send_uid, m.title, m.content, m.created_at, m.read_at});
            got = {{"ok", ok},
                   {"total", response.total},
                   {"limit", response.limit},
                   {"offset", response.offset},
                   {"is_not_read", response.is_not_read},
                   {"messages", messages}};
        });
        QTRY_VERIFY(!got.isEmpty());
        fixture::compare(got, row["got"]);
        fixture::compareLog(log, row["log"]);
        // What marks messages as read succeeds and fails alike.
        QList<bool> marked;
        const auto done = [&marked](bool ok, const QString&) { marked.append(ok); };
        m_messages->readNotifyMessage("1", done);
        m_messages->readAllNotifyMessage("1", done);
        const bool good = got["ok"].toBool();
        QTRY_COMPARE(marked, QList<bool>({good, good}));
    }

    void texts()
    {
        QCOMPARE(QNotification::formatUnReadNumber(99), QString("99"));
        QCOMPARE(QNotification::formatUnReadNumber(100), QString("..."));
        const QString shown = QNotification::getCurrentTime();
        const QDateTime time = QDateTime::fromString(shown, "yyyy-MM-dd hh:mm:ss");
        QVERIFY2(time.isValid() && qAbs(time.secsTo(QDateTime::currentDateTime())) < 30, qPrintable(shown));
    }

    void names_data() { fixture::addRows("names.json"); }
    void names()
    {
        QFETCH(QJsonObject, row);
        m_platform.addFault({{"path", "*/config"}}, row["rule"].toObject());
        m_platform.addFault({{"path", "*/verify/name"}}, row["verdict"].toObject());
        m_server->getCaCert("server.zent.test", "80");
        m_platform.clearRecord();
        const LogCapture log;
        QString message;
        QCOMPARE(m_server->checkPcName(row["name"].toString("ab 1"), message), row["accepted"].toBool());
        QCOMPARE(message, row["message"].toString());
        QJsonArray sent;
        for (const QJsonObject& request : m_platform.record("http"))
            sent.append(request["headers"].toObject()["host"].toString() + request["path"].toString() + '?' +
                        request["raw_query"].toString());
        fixture::compare(sent, row["sent"]);
        fixture::compareLog(log, row["log"]);
    }

    void nameRules_data() { fixture::addRows("namerules.json"); }
    void nameRules()
    {
        QFETCH(QJsonObject, row);
        const QString rule = QString(QTest::currentDataTag()).repeated(row["times"].toInt(1));
        QCOMPARE(zent::isBearableRule(rule), row["bearable"].toBool());
        // The slowest that were met among many thousands, of those that are let through.
        if (!row["slow"].toBool())
            return;
        QVERIFY(zent::matchPcName(rule, QString(255, 'a')).whole);
        const std::clock_t began = std::clock();
        zent::matchPcName(rule, QString(254, 'a') + '!');
        QVERIFY2(std::clock() - began < CLOCKS_PER_SEC / 2, "a name that nearly fits takes long");
    }

    void macAddress_data() { fixture::addRows("connections.json"); }
    void macAddress()
    {
        QFETCH(QJsonObject, row);
        if (row.contains("fault"))
            m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, row["fault"].toObject());
        m_platform.patchState({{"connections", row["connections"]}});
        const LogCapture log;
        QCOMPARE(FileConfig::GetInstance()->getMacAddress(), row["mac"].toString());
        fixture::compareLog(log, row["log"]);
    }

    void theAuthoritysFileIsFollowed()
    {
        const QByteArray authority = testfiles::read(testfiles::kAuthorityFile);
        const QByteArray contents[] = {authority, testfiles::read("/run/room/tls/unknown_ca.crt"), authority, {}};
        m_platform.addFault({{"path", "*"}}, {{"body", "[]"}});
        QCOMPARE(zent::http::tlsBesideSystem(testfiles::kAuthorityFile).protocol(), QSsl::TlsV1_2OrLater);
        QList<bool> results;
        for (const QByteArray& content : contents) {
            testfiles::write(testfiles::kAuthorityFile, content);
            // Requests within one second share their URL and thus their callback.
            m_messages->getNotifyMessageList(kName, true, 1, 10 + results.size(),
                                             [&](bool ok, const auto&) { results.append(ok); });
            QTRY_COMPARE(m_messages->pendingRequests(), 0);
            m_server->postQuitControl(kName);
            // The reply goes with its deletion.
            QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
        }
        testfiles::write(testfiles::kAuthorityFile, authority);
        QCOMPARE(results, QList<bool>({true, false, true, false}));
        fixture::compare(m_signals, QJsonArray{"sigQuitControl 200 []", "sigQuitControl -6 ", "sigQuitControl 200 []",
                                               "sigQuitControl -6 "});
        // While it stays, so does the connection.
        for (const int limit : {20, 21}) {
            m_messages->getNotifyMessageList(kName, true, 1, limit, [](bool, const auto&) {});
            QTRY_COMPARE(m_messages->pendingRequests(), 0);
        }
        const auto sent = m_platform.requests("/box/v9/list");
        QCOMPARE(sent.last()["connection"], sent[sent.size() - 2]["connection"]);
    }

    void aSlowServerIsPolledLess()
    {
        m_platform.addFault({{"path", "*"}}, {{"delay_ms", 250}, {"status", 207}});
        m_server->getUserInfo(kName);
        m_server->getCompanyName();
        m_server->getUserInfo(kName);
        m_server->postQuitControl(kName);
        const QJsonArray expected{"sigUserInfo 207 ", "sigCompanyName -4 ", "sigUserInfo -4 ", "sigQuitControl 207 "};
        fixture::compare(m_signals, expected);
    }
};

QTEST_GUILESS_MAIN(TestRequests)
#include "test_requests.moc"

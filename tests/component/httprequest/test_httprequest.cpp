#include "dbusnames.h"
#include "fileconfig.h"
#include "httprequest.h"
#include "logcapture.h"
#include "networkdaemonproxy.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"

#include <QtTest>

#include <functional>

class TestHttpRequest : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    HttpRequest* const m_client = HttpRequest::GetInstance();

    void answer(const QString& path, int status, const QJsonObject& body)
    {
        const QString text = QString::fromUtf8(QJsonDocument(body).toJson());
        m_platform.addFault({{"path", "/uim/v3/client/" + path}}, {{"status", status}, {"body", text}});
    }

private slots:
    void initTestCase()
    {
        testfiles::write(zent::kMachineidPath, "m-1\n");
        FileConfig* config = FileConfig::GetInstance();
        config->setServerHost("server.zent.test");
        config->setServerPort("443");
        config->setDomainHost("domain.zent.test");
        config->setDomainPort("443");
    }

    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
    }

    /// The requests that nothing in the windows makes.
    void operations()
    {
        const std::tuple<const char*, const char*, std::function<void(HttpRequest&)>> rows[] = {
            {"GET /apiauth/v1/client/ca_cert?", "", [](HttpRequest& r) { r.getCaCert("server.zent.test", "443"); }},
            {"GET /uim/v3/client/status?machine_id=m-1&keyword=join&username=a%26b", "",
             [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(0), "a&b"); }},
            {"POST /uim/v3/client/join?", "mac machine_id name username",
             [](HttpRequest& r) { r.postJoinControl("a"); }},
            {"POST /uim/v3/client/auth?", "password username", [](HttpRequest& r) { r.postCheckAccountPwd("a", "p"); }},
        };
        for (const auto& [sent, bodyKeys, run] : rows) {
            run(*m_client);
            const QJsonObject request = m_platform.record("http").last();
            const auto text = [&request](const char* key) { return request.value(QLatin1String(key)).toString(); };
            QCOMPARE(text("method") + ' ' + text("path") + '?' + text("raw_query"), sent);
            QCOMPARE(QJsonDocument::fromJson(text("body").toUtf8()).object().keys().join(' '), bodyKeys);
        }
    }

    void hangingNetworkDaemonCostsOneTimeOut()
    {
        NetworkDaemonProxy daemon(zent::dbus::kNetworkService, zent::dbus::kNetworkPath, QDBusConnection::sessionBus());
        daemon.setTimeout(1500);
        LogCapture log;
        // A failure that comes at once does not keep it from being asked.
        const QPair<QJsonObject, int> faults[] = {{{{"error", "com.vantor.Error.Failed"}}, 2}, {{{"hang", true}}, 1}};
        for (const auto& [action, asked] : faults) {
            m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, action);
            m_platform.clearRecord();
            QVERIFY(!daemon.activeConnectionInfo() && !daemon.activeConnectionInfo());
            QCOMPARE(m_platform.record("dbus").size(), asked);
        }
        QCOMPARE(log.count("GetActiveConnectionInfo failed: com.vantor.Error.Failed"), 2);
        QCOMPARE(log.count("not asked again for 60 s"), 1);
    }

    void terminalNames()
    {
        struct Row {
            QString expression;
            QString name;
            bool accepted;
            QString said;
            int status = 200;
            int code = 0;
        };
        const QString refused = QStringLiteral("终端别名不符合正则安全规则!!");
        const QString invalid = QStringLiteral("正则表达式不合法");
        const Row rows[] = {
            {"/[a-z]+/", "abc", true, ""},
            {"[a-z]+", "abc1", false, refused},
            // Would take very long if it were searched.
            {"((((((a?){8}){8}){8}){8}){8})", "a", false, invalid},
            // Without a rule it is left to the server.
            {"", "a b", true, "said"},
            {"", "a b", false, "said", 200, 4},
            {"", "a b", false, QStringLiteral("域管服务配置失败，请重试"), 500},
        };
        for (const Row& row : rows) {
            const QJsonObject rule{{"regular_expression", row.expression}};
            answer("config", 200, {{"code", 0}, {"message", QString::fromUtf8(QJsonDocument(rule).toJson())}});
            answer("pc/verify/name", row.status, {{"code", row.code}, {"msg", "said"}});
            m_client->getCaCert("server.zent.test", "443");
            QString text;
            QCOMPARE(m_client->checkPcName(row.name, text), row.accepted);
            QCOMPARE(text, row.said);
            QCOMPARE(m_platform.record("http").last().value("raw_query") == "pc_name=a%20b", row.expression.isEmpty());
        }
    }
};

QTEST_GUILESS_MAIN(TestHttpRequest)
#include "test_httprequest.moc"

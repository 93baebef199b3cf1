#include "dbusnames.h"
#include "fileconfig.h"
#include "httprequest.h"
#include "logcapture.h"
#include "networkdaemonproxy.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"
#include "testrows.h"

#include <QSignalSpy>

#include <functional>

using Operation = std::function<void(HttpRequest&)>;
Q_DECLARE_METATYPE(Operation)

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
    static QString rule(const QString& expression)
    {
        return QString::fromUtf8(QJsonDocument(QJsonObject{{"regular_expression", expression}}).toJson());
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
        config->setTerminalName(QStringLiteral("终端"));
    }

    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
    }

    void operations_data()
    {
        addColumns<Operation, QString, QString, QString>("operation", "signal", "sent", "bodyKeys");
        const auto row = [](const char* name, const char* sent, const char* keys, const char* signal, Operation run) {
            addRow(name, run, signal, sent, keys);
        };
        row("ca", "GET /apiauth/v1/client/ca_cert?", "", SIGNAL(sigCaCert(int, QString)),
            [](HttpRequest& r) { r.getCaCert("server.zent.test", "443"); });
        const char* checked = SIGNAL(sigMacheineCheck(int, QString));
        row("join state", "GET /uim/v3/client/status?machine_id=m-1&keyword=join&username=a%26b", "", checked,
            [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(0), "a&b"); });
        row("remove state", "GET /uim/v3/client/status?machine_id=m-1&keyword=remove&username=a", "", checked,
            [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(1), "a"); });
        row("other state", "GET /uim/v3/client/status?machine_id=m-1&username=a", "", checked,
            [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(2), "a"); });
        row("account", "POST /uim/v3/client/auth?", "password username", SIGNAL(sigCheckAccountPwd(int, QString)),
            [](HttpRequest& r) { r.postCheckAccountPwd("a", "p"); });
        row("join", "POST /uim/v3/client/join?", "mac machine_id name username", SIGNAL(sigJoinControl(int, QString)),
            [](HttpRequest& r) { r.postJoinControl("a"); });
        row("quit", "POST /uim/v3/client/remove?", "mac machine_id username", SIGNAL(sigQuitControl(int, QString)),
            [](HttpRequest& r) { r.postQuitControl("a"); });
        row("remove status", "POST /uim/v3/client/remove_status?", "machine_id password username",
            SIGNAL(sigRemoveStatus(int, QString)), [](HttpRequest& r) { r.postRemoveStatus("a", "p"); });
        row("company", "GET /uim/v3/client/uim_department/id?id=1", "", SIGNAL(sigCompanyName(int, QString)),
            [](HttpRequest& r) { r.getCompanyName(); });
        row("user", "GET /uim/v3/client/account?", "machine_id username", SIGNAL(sigUserInfo(int, QString)),
            [](HttpRequest& r) { r.getUserInfo("a"); });
    }
    void operations()
    {
        QFETCH(Operation, operation);
        QFETCH(QString, signal);
        QFETCH(QString, sent);
        QFETCH(QString, bodyKeys);
        QSignalSpy spy(m_client, qPrintable(signal));
        operation(*m_client);
        // Synchronous: the signal has come before the operation returned.
        QCOMPARE(spy.count(), 1);
        QCOMPARE(spy.first().at(0).toInt(), 200);
        QVERIFY(spy.first().at(1).toString().startsWith('{'));

        const QJsonObject request = m_platform.record("http").value(0);
        const auto text = [&request](const char* key) { return request.value(QLatin1String(key)).toString(); };
        QCOMPARE(text("method") + ' ' + text("path") + '?' + text("raw_query"), sent);
        const QJsonObject body = QJsonDocument::fromJson(text("body").toUtf8()).object();
        QCOMPARE(body.keys().join(' '), bodyKeys);
        const QJsonObject headers = request.value("headers").toObject();
        QCOMPARE(headers.value("content-type").toString(), QString(bodyKeys.isEmpty() ? "" : "application/json"));
        QVERIFY(!headers.contains("x-lumo-version"));
        QVERIFY(!request.value("client_certificate").isNull());
    }

    void macComesFromThePrimaryConnection()
    {
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}},
                            {{"value", R"([{"IsPrimaryConnection": false, "HwAddress": "x"},
                                {"IsPrimaryConnection": true, "HwAddress": "52:54"}])"}});
        QCOMPARE(FileConfig::GetInstance()->getMacAddress(), QStringLiteral("52:54"));
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, {{"error", "com.vantor.Error.Failed"}});
        LogCapture log;
        QCOMPARE(FileConfig::GetInstance()->getMacAddress(), QString());
        QVERIFY(log.contains("GetActiveConnectionInfo error"));
    }

    void hangingNetworkDaemonCostsOneTimeOut()
    {
        NetworkDaemonProxy daemon(zent::dbus::kNetworkService, zent::dbus::kNetworkPath, QDBusConnection::sessionBus());
        daemon.setTimeout(1500);
        LogCapture log;
        const auto askTwice = [&] {
            m_platform.clearRecord();
            QVERIFY(!daemon.activeConnectionInfo() && !daemon.activeConnectionInfo());
        };
        // A failure that comes at once does not keep it from being asked.
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, {{"error", "com.vantor.Error.Failed"}});
        askTwice();
        QCOMPARE(m_platform.record("dbus").size(), 2);
        QCOMPARE(log.count("GetActiveConnectionInfo failed: com.vantor.Error.Failed"), 2);
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, {{"hang", true}});
        askTwice();
        QCOMPARE(m_platform.record("dbus").size(), 1);
        QCOMPARE(log.count("not asked again for 60 s"), 1);
    }

    void failedRequestStillSignals()
    {
        m_platform.addFault({{"path", "/uim/v3/client/account"}}, {{"drop", "before"}});
        QSignalSpy spy(m_client, &HttpRequest::sigUserInfo);
        m_client->getUserInfo("a");
        QCOMPARE(spy.count(), 1);
        QVERIFY(spy.first().at(0).toInt() < 0);
        QCOMPARE(spy.first().at(1).toString(), QString());
    }

    void namingRule_data()
    {
        addColumns<QString, QString, bool, QString>("message", "name", "accepted", "said");
        const QString refused = QStringLiteral("终端别名不符合正则安全规则!!");
        addRow("covers the name", rule("[a-z]+"), "abc", true, "");
        addRow("in slashes", rule("/[a-z]+/"), "abc", true, "");
        addRow("partial match", rule("[a-z]+"), "abc1", false, refused);
        addRow("match inside only", rule("[0-9]"), "a1b", false, refused);
        addRow("case-sensitive", rule("[a-z]+"), "ABC", false, refused);
        addRow("only a slash", rule("/"), "abc", false, "");
        const QString invalid = QStringLiteral("正则表达式不合法");
        addRow("invalid", rule("[a-z"), "abc", false, invalid);
        addRow("looks ahead", rule("(?=.*[0-9])(?!.*--)[a-z0-9-]{3,20}"), "pc-17", true, "");
        addRow("longest name", rule("[a-z]{1,255}"), QString(255, 'a'), true, "");
        // Each of these would take very long, or end the process, if it were compiled or searched.
        addRow("counts in counts", rule("((((((a?){8}){8}){8}){8}){8})"), "a", false, invalid);
        addRow("counts beside a class", rule("[](]((((((a?){8}){8}){8}){8}){8})"), "(a", false, invalid);
        addRow("1000 optional characters", rule(QString("a?").repeated(1000)), "a", false, invalid);
        addRow("deep groups", rule(QString(20000, '(') + 'a' + QString(20000, ')')), "a", false, invalid);
        addRow("ahead with references", rule("((a)|(?=a+(?:a\\1{1,18}){5}(a?[a-z]*\\1){28})|\\1)*b{21}\\1"), "a", false,
               invalid);
        addRow("ahead within ahead", rule(QString("(?=.*").repeated(6) + 'x' + QString(6, ')')), QString(64, 'a'),
               false, invalid);
        addRow("broken inner text", "[1,", "abc", false, QStringLiteral("域管服务配置失败，请重试"));
        addRow("no rule", "{}", "abc", false, QStringLiteral("服务端返回终端规则数据为空"));
    }
    void namingRule()
    {
        QFETCH(QString, message);
        QFETCH(QString, name);
        QFETCH(bool, accepted);
        QFETCH(QString, said);
        answer("config", 200, {{"code", 0}, {"message", message}});
        m_client->getCaCert("server.zent.test", "443");
        QString text;
        QCOMPARE(m_client->checkPcName(name, text), accepted);
        QCOMPARE(text, said);
        QVERIFY(!m_platform.record("http").last().value("path").toString().endsWith("/verify/name"));
    }

    void emptyRuleLeavesItToTheServer_data()
    {
        addColumns<int, int, bool, QString>("status", "code", "accepted", "said");
        addRow("accepted", 200, 0, true, "said");
        addRow("taken", 200, 4, false, "said");
        addRow("error with a good body", 500, 0, false, QStringLiteral("域管服务配置失败，请重试"));
    }
    void emptyRuleLeavesItToTheServer()
    {
        QFETCH(int, status);
        QFETCH(int, code);
        QFETCH(bool, accepted);
        QFETCH(QString, said);
        answer("config", 200, {{"code", 0}, {"message", rule(QString())}});
        answer("pc/verify/name", status, {{"code", code}, {"msg", "said"}});
        QString text;
        QCOMPARE(m_client->checkPcName("a b", text), accepted);
        QCOMPARE(text, said);
        QCOMPARE(m_platform.record("http").last().value("raw_query").toString(), QStringLiteral("pc_name=a%20b"));
    }
};

QTEST_GUILESS_MAIN(TestHttpRequest)
#include "test_httprequest.moc"

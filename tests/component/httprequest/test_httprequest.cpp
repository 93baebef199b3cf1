#include "fileconfig.h"
#include "httprequest.h"
#include "logcapture.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"

#include <QSignalSpy>
#include <QtTest>

#include <functional>

namespace
{

/// What one operation must send: method, path, raw query, keys of the body.
struct Sent {
    QString method;
    QString path;
    QString query;
    QStringList bodyKeys;
};

} // namespace

Q_DECLARE_METATYPE(Sent)
using Operation = std::function<void(HttpRequest&)>;
Q_DECLARE_METATYPE(Operation)

class TestHttpRequest : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;

    void serveRule(const QString& rule)
    {
        const QByteArray inner = QJsonDocument(QJsonObject{{"regular_expression", rule}}).toJson();
        serveRuleMessage(QString::fromUtf8(inner));
    }
    void serveRuleMessage(const QString& message)
    {
        const QByteArray body = QJsonDocument(QJsonObject{{"code", 0}, {"message", message}}).toJson();
        m_platform.addFault({{"path", "/uim/v3/client/config"}}, {{"status", 200}, {"body", QString::fromUtf8(body)}});
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
        QTest::addColumn<Operation>("operation");
        QTest::addColumn<QByteArray>("signal");
        QTest::addColumn<Sent>("sent");
        const auto row = [](const char* name, const char* signal, Sent sent, Operation operation) {
            QTest::newRow(name) << operation << QByteArray(signal) << sent;
        };
        row("ca", SIGNAL(sigCaCert(int, QString)), {"GET", "/apiauth/v1/client/ca_cert", "", {}},
            [](HttpRequest& r) { r.getCaCert("server.zent.test", "443"); });
        row("join state", SIGNAL(sigMacheineCheck(int, QString)),
            {"GET", "/uim/v3/client/status", "machine_id=m-1&keyword=join&username=a%26b", {}},
            [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(0), "a&b"); });
        row("remove state", SIGNAL(sigMacheineCheck(int, QString)),
            {"GET", "/uim/v3/client/status", "machine_id=m-1&keyword=remove&username=a", {}},
            [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(1), "a"); });
        row("other state", SIGNAL(sigMacheineCheck(int, QString)),
            {"GET", "/uim/v3/client/status", "machine_id=m-1&username=a", {}},
            [](HttpRequest& r) { r.getMacheineCheck(static_cast<MachineState>(2), "a"); });
        row("account", SIGNAL(sigCheckAccountPwd(int, QString)),
            {"POST", "/uim/v3/client/auth", "", {"password", "username"}},
            [](HttpRequest& r) { r.postCheckAccountPwd("a", "p"); });
        row("join", SIGNAL(sigJoinControl(int, QString)),
            {"POST", "/uim/v3/client/join", "", {"mac", "machine_id", "name", "username"}},
            [](HttpRequest& r) { r.postJoinControl("a"); });
        row("quit", SIGNAL(sigQuitControl(int, QString)),
            {"POST", "/uim/v3/client/remove", "", {"mac", "machine_id", "username"}},
            [](HttpRequest& r) { r.postQuitControl("a"); });
        row("remove status", SIGNAL(sigRemoveStatus(int, QString)),
            {"POST", "/uim/v3/client/remove_status", "", {"machine_id", "password", "username"}},
            [](HttpRequest& r) { r.postRemoveStatus("a", "p"); });
        row("company", SIGNAL(sigCompanyName(int, QString)), {"GET", "/uim/v3/client/uim_department/id", "id=1", {}},
            [](HttpRequest& r) { r.getCompanyName(); });
        row("user", SIGNAL(sigUserInfo(int, QString)),
            {"GET", "/uim/v3/client/account", "", {"machine_id", "username"}},
            [](HttpRequest& r) { r.getUserInfo("a"); });
    }
    void operations()
    {
        QFETCH(Operation, operation);
        QFETCH(QByteArray, signal);
        QFETCH(Sent, sent);
        HttpRequest* client = HttpRequest::GetInstance();
        QSignalSpy spy(client, signal.constData());
        operation(*client);
        // Synchronous: the signal has come before the operation returned.
        QCOMPARE(spy.count(), 1);
        QCOMPARE(spy.first().at(0).toInt(), 200);
        QVERIFY(spy.first().at(1).toString().startsWith('{'));

        const QJsonObject request = m_platform.record("http").value(0);
        QCOMPARE(request.value("method").toString(), sent.method);
        QCOMPARE(request.value("path").toString(), sent.path);
        QCOMPARE(request.value("raw_query").toString(), sent.query);
        const QByteArray body = request.value("body").toString().toUtf8();
        QCOMPARE(QJsonDocument::fromJson(body).object().keys(), sent.bodyKeys);
        const QJsonObject headers = request.value("headers").toObject();
        QCOMPARE(headers.value("content-type").toString(), body.isEmpty() ? QString() : QString("application/json"));
        QVERIFY(!headers.contains("x-lumo-version"));
        QVERIFY(!request.value("client_certificate").isNull());
    }

    void macComesFromThePrimaryConnection()
    {
        const QString mac = QStringLiteral("52:54:00:aa:bb:cc");
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}},
                            {{"value", QStringLiteral(R"([{"IsPrimaryConnection": false, "HwAddress": "x"},
                                {"IsPrimaryConnection": true, "HwAddress": "%1"}])")
                                           .arg(mac)}});
        QCOMPARE(FileConfig::GetInstance()->getMacAddress(), mac);
        m_platform.addFault({{"dbus", "GetActiveConnectionInfo"}}, {{"error", "com.vantor.Error.Failed"}});
        LogCapture log;
        QCOMPARE(FileConfig::GetInstance()->getMacAddress(), QString());
        QVERIFY(log.contains("GetActiveConnectionInfo error"));
    }

    void failedRequestStillSignals()
    {
        HttpRequest* client = HttpRequest::GetInstance();
        m_platform.addFault({{"path", "/uim/v3/client/account"}}, {{"drop", "before"}});
        QSignalSpy spy(client, &HttpRequest::sigUserInfo);
        client->getUserInfo("a");
        QCOMPARE(spy.count(), 1);
        QVERIFY(spy.first().at(0).toInt() < 0);
        QCOMPARE(spy.first().at(1).toString(), QString());
    }

    void namingRule_data()
    {
        QTest::addColumn<QString>("rule");
        QTest::addColumn<QString>("name");
        QTest::addColumn<bool>("accepted");
        QTest::addColumn<QString>("message");
        const QString refused = QStringLiteral("终端别名不符合正则安全规则!!");
        QTest::newRow("covers the name") << "[a-z]+"
                                         << "abc" << true << "";
        QTest::newRow("in slashes") << "/[a-z]+/"
                                    << "abc" << true << "";
        QTest::newRow("partial match") << "[a-z]+"
                                       << "abc1" << false << refused;
        QTest::newRow("match inside only") << "[0-9]"
                                           << "a1b" << false << refused;
        QTest::newRow("case-sensitive") << "[a-z]+"
                                        << "ABC" << false << refused;
        QTest::newRow("no match") << "[0-9]+"
                                  << "abc" << false << refused;
        QTest::newRow("only a slash") << "/"
                                      << "abc" << false << "";
        QTest::newRow("invalid") << "[a-z"
                                 << "abc" << false << QStringLiteral("正则表达式不合法");
    }
    void namingRule()
    {
        QFETCH(QString, rule);
        QFETCH(QString, name);
        QFETCH(bool, accepted);
        QFETCH(QString, message);
        serveRule(rule);
        HttpRequest::GetInstance()->getCaCert("server.zent.test", "443");
        QString said;
        QCOMPARE(HttpRequest::GetInstance()->checkPcName(name, said), accepted);
        QCOMPARE(said, message);
        for (const QJsonObject& request : m_platform.record("http"))
            QVERIFY(request.value("path").toString() != QStringLiteral("/uim/v3/client/pc/verify/name"));
    }

    void emptyRuleLeavesItToTheServer()
    {
        serveRule(QString());
        m_platform.addFault({{"path", "/uim/v3/client/pc/verify/name"}},
                            {{"status", 200}, {"body", R"({"code": 4, "msg": "taken"})"}});
        QString message;
        QVERIFY(!HttpRequest::GetInstance()->checkPcName("a b", message));
        QCOMPARE(message, QStringLiteral("taken"));
        QCOMPARE(m_platform.record("http").last().value("raw_query").toString(), QStringLiteral("pc_name=a%20b"));
    }

    void ruleFailures_data()
    {
        QTest::addColumn<QString>("message");
        QTest::addColumn<QString>("said");
        QTest::newRow("broken inner text") << "[1," << QStringLiteral("域管服务配置失败，请重试");
        QTest::newRow("no rule") << "{}" << QStringLiteral("服务端返回终端规则数据为空");
    }
    void ruleFailures()
    {
        QFETCH(QString, message);
        QFETCH(QString, said);
        serveRuleMessage(message);
        QString text;
        QVERIFY(!HttpRequest::GetInstance()->checkPcName("a", text));
        QCOMPARE(text, said);
    }

    void nameCheckNeedsStatus200()
    {
        m_platform.addFault({{"path", "/uim/v3/client/pc/verify/name"}},
                            {{"status", 500}, {"body", R"({"code": 0, "msg": "fine"})"}});
        QString message;
        QVERIFY(!HttpRequest::GetInstance()->checkTerminalByServer("a", message));
        QCOMPARE(message, QStringLiteral("域管服务配置失败，请重试"));
        m_platform.clearFaults();
        QVERIFY(HttpRequest::GetInstance()->checkTerminalByServer("good-name", message));
    }
};

QTEST_GUILESS_MAIN(TestHttpRequest)
#include "test_httprequest.moc"

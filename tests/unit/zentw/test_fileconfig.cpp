#include "activeconnections.h"
#include "fileconfig.h"
#include "logcapture.h"
#include "paths.h"
#include "pcnamerules.h"
#include "testfiles.h"
#include "urlquery.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <QtTest>

using zent::kTmpUserinfoPath;
using zent::kUserinfoPath;
using zent::PcNameRule;

namespace
{

const QString kStagingDirectory = QFileInfo(kTmpUserinfoPath).path();
const QByteArray kInfo = R"({"is_Domain": true, "server_host": "s.test", "server_port": "8443",
    "domain_host": "d.test", "domain_port": "", "terminal_name": "终端"})";

void load(const QByteArray& content)
{
    testfiles::write(kUserinfoPath, content);
    FileConfig::GetInstance()->readServerConfig(kUserinfoPath);
}

} // namespace

class TestFileConfig : public QObject
{
    Q_OBJECT

    FileConfig* m_config = FileConfig::GetInstance();

private slots:
    void init()
    {
        testfiles::remove(kStagingDirectory);
        load("{}");
    }

    void loadedValues()
    {
        load(kInfo);
        QCOMPARE(m_config->getServerUrl("/uim/v3/client/auth").toString(),
                 QString("https://s.test:8443/uim/v3/client/auth"));
        QCOMPARE(m_config->getDomainUrl("/a b").port(), 0);
        QCOMPARE(m_config->readTerminalName(), QString("终端"));
        QVERIFY(m_config->readIsDomain());
        LogCapture log;
        load(kInfo.left(50));
        QCOMPARE(m_config->readServerHost(), QString("s.test"));
        QVERIFY(log.contains("userinfo.json Json error"));
    }

    void withoutAFileTheTerminalIsCalledAsTheHost()
    {
        testfiles::remove(kUserinfoPath);
        testfiles::write(zent::kHostnamePath, "host-9\n");
        LogCapture log;
        m_config->readServerConfig(kUserinfoPath);
        QCOMPARE(m_config->readTerminalName(), QString("host-9"));
        QVERIFY(m_config->getServerUrl("/x").host().isEmpty());
        QVERIFY(log.contains(" not found userinfo.json"));
        testfiles::remove(zent::kHostnamePath);
        QCOMPARE(m_config->readHostName(), QString());
    }

    void stagingCopyCarriesTheChangeOnly()
    {
        load(kInfo);
        m_config->setIsDomain(false);
        QTemporaryDir elsewhere;
        QVERIFY(QFile::link(elsewhere.path(), kStagingDirectory));
        m_config->writeServerConfig();
        QVERIFY2(QDir(elsewhere.path()).isEmpty(), "followed a link that lay in wait");
        QFile::remove(kStagingDirectory);
        m_config->writeServerConfig();
        QJsonObject expected = QJsonDocument::fromJson(kInfo).object();
        expected.insert("is_Domain", false);
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(kTmpUserinfoPath)).object(), expected);
        QCOMPARE(testfiles::read(kUserinfoPath), kInfo);
    }

    void certificateReachesANewDirectory()
    {
        m_config->saveCert(QByteArray("PEM\n").toBase64(), kStagingDirectory + "/sub/cert.pem");
        QCOMPARE(testfiles::read(kStagingDirectory + "/sub/cert.pem"), QByteArray("PEM\n"));
    }

    void queryValuesCannotChangeTheRequest()
    {
        const QUrl url = zent::withQuery(QUrl("https://h/p"), {{"name", "a&b=c+d%31 e\n"}, {"user", "张"}});
        QCOMPARE(url.toString(QUrl::FullyEncoded),
                 QStringLiteral("https://h/p?name=a%26b%3Dc%2Bd%2531%20e%0A&user=%E5%BC%A0"));
    }

    void connections()
    {
        const auto primaries = [](const QByteArray& json) {
            QStringList texts;
            for (const auto& c : zent::activeConnections(zent::parseConnectionArray(json).value_or(QJsonArray()))) {
                if (c.primary)
                    texts.append(c.hwAddress + c.speed + c.address + c.mask + c.gateway + c.dns);
            }
            return texts;
        };
        QCOMPARE(primaries(R"([{"HwAddress": "a"}, {"IsPrimaryConnection": true, "HwAddress": "b", "Speed": "1",
            "Ip4": {"Address": "2", "Mask": "3", "Gateways": ["4", "x"], "Dnses": ["5", "y"]}}])"),
                 QStringList("b12345"));
        QCOMPARE(primaries(R"([{"IsPrimaryConnection": null}, {"IsPrimaryConnection": true, "HwAddress": null,
            "Speed": "1", "Ip4": {"Gateways": []}}])"),
                 QStringList("1"));
        for (const char* odd : {"{}", "", "[7]", R"([{"IsPrimaryConnection": "yes"}])", R"([{"HwAddress": 1}])",
                                R"([{"Ip4": []}])", R"([{"Ip4": {"Dnses": {}}}])", R"([{"Ip4": {"Gateways": [4]}}])"})
            QVERIFY2(!zent::parseConnectionArray(odd), odd);
    }

    void namingRules()
    {
        using State = PcNameRule::State;
        struct Row {
            QByteArray reply;
            State state;
            QString expression;
        };
        const auto reply = [](const QJsonValue& message) {
            return QJsonDocument(QJsonObject{{"code", 0}, {"message", message}}).toJson();
        };
        const QList<Row> rows = {
            {reply(R"({"regular_expression": "/a+/"})"), State::Given, "/a+/"},
            {reply(R"({"regular_expression": ""})"), State::Given, ""},
            {reply(R"({"regular_expression": 4})"), State::Missing, ""},
            {reply("[]"), State::Missing, ""},
            {reply(QJsonObject()), State::NotJson, ""},
            {R"({"code": 3, "message": "{}"})", State::Refused, ""},
            {R"({"message": "{}"})", State::Refused, ""},
            {"<html>", State::NotJson, ""},
        };
        for (const Row& row : rows) {
            const PcNameRule rule = zent::parsePcNameRule(row.reply);
            QVERIFY2(rule.state == row.state, row.reply);
            QCOMPARE(rule.expression, row.expression);
        }
    }
};

QTEST_GUILESS_MAIN(TestFileConfig)
#include "test_fileconfig.moc"

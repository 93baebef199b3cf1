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

Q_DECLARE_METATYPE(PcNameRule::State)

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

private slots:
    void init()
    {
        testfiles::remove(kStagingDirectory);
        load("{}");
    }

    void urls()
    {
        load(kInfo);
        const FileConfig* config = FileConfig::GetInstance();
        QCOMPARE(config->getServerUrl("/uim/v3/client/auth").toString(),
                 QStringLiteral("https://s.test:8443/uim/v3/client/auth"));
        QCOMPARE(config->getDomainUrl("/a b").port(), 0);
        QCOMPARE(config->getDomainUrl("/a b").path(), QStringLiteral("/a b"));
        QCOMPARE(config->readTerminalName(), QStringLiteral("终端"));
        QVERIFY(config->readIsDomain());
    }

    void withoutAFileTheTerminalIsCalledAsTheHost()
    {
        testfiles::remove(kUserinfoPath);
        testfiles::write(zent::kHostnamePath, "host-9\n");
        LogCapture log;
        FileConfig* config = FileConfig::GetInstance();
        config->readServerConfig(kUserinfoPath);
        QCOMPARE(config->readTerminalName(), QStringLiteral("host-9"));
        QVERIFY(config->getServerUrl("/x").host().isEmpty());
        QVERIFY(log.contains(" not found userinfo.json"));
        testfiles::remove(zent::kHostnamePath);
        QCOMPARE(config->readHostName(), QString());
        QVERIFY(log.contains(" not found : \"/etc/hostname\""));
    }

    void brokenFileChangesNothing()
    {
        load(kInfo);
        LogCapture log;
        load(kInfo.left(50));
        QCOMPARE(FileConfig::GetInstance()->readServerHost(), QStringLiteral("s.test"));
        QVERIFY(log.contains("userinfo.json Json error"));
    }

    void stagingCopyCarriesTheChangeOnly()
    {
        load(kInfo);
        FileConfig* config = FileConfig::GetInstance();
        config->setIsDomain(false);
        config->writeServerConfig();
        QJsonObject expected = QJsonDocument::fromJson(kInfo).object();
        expected.insert("is_Domain", false);
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(kTmpUserinfoPath)).object(), expected);
        QCOMPARE(testfiles::read(kUserinfoPath), kInfo);
    }

    void stagingDirectoryThatIsALinkIsRefused()
    {
        QTemporaryDir elsewhere;
        QVERIFY(QFile::link(elsewhere.path(), kStagingDirectory));
        LogCapture log;
        FileConfig::GetInstance()->writeServerConfig();
        QVERIFY(log.contains("file open error"));
        QVERIFY(QDir(elsewhere.path()).isEmpty());
        QFile::remove(kStagingDirectory);
    }

    void certificateHandOver()
    {
        QTemporaryDir directory;
        const QString path = directory.filePath("new/sub/cert.pem");
        FileConfig::GetInstance()->saveCert(QByteArray("PEM\n").toBase64(), path);
        QCOMPARE(testfiles::read(path), QByteArray("PEM\n"));
        LogCapture log;
        FileConfig::GetInstance()->saveCert(QString(), directory.path());
        QVERIFY(log.contains("writeCERT open error! "));
    }

    void queryValuesCannotChangeTheRequest()
    {
        const QUrl url = zent::withQuery(QUrl("https://h/p"), {{"name", "a&b=c+d%31 e\n"}, {"user", "张"}});
        QCOMPARE(url.toString(QUrl::FullyEncoded),
                 QStringLiteral("https://h/p?name=a%26b%3Dc%2Bd%2531%20e%0A&user=%E5%BC%A0"));
    }

    void connections_data()
    {
        QTest::addColumn<QByteArray>("json");
        QTest::addColumn<int>("count");
        QTest::addColumn<QString>("lastPrimary");
        QTest::newRow("second primary") << QByteArray(R"([{"IsPrimaryConnection": false, "HwAddress": "a"},
            {"IsPrimaryConnection": true, "HwAddress": "b", "Speed": "1", "Ip4": {"Address": "2", "Mask": "3",
            "Gateways": ["4", "x"], "Dnses": ["5", "y"]}}])")
                                        << 2 << "b12345";
        QTest::newRow("no gateways") << QByteArray(R"([{"IsPrimaryConnection": true, "HwAddress": "b", "Speed": "1",
            "Ip4": {"Address": "2", "Mask": "3", "Gateways": [], "Dnses": []}}])")
                                     << 1 << "b123";
        QTest::newRow("wrong types") << QByteArray(R"([{"IsPrimaryConnection": "yes"}, 7, null, {"Ip4": []},
            {"IsPrimaryConnection": true, "HwAddress": 1, "Speed": [], "Ip4": {"Dnses": {}}}])")
                                     << 5 << "";
        QTest::newRow("object") << QByteArray("{}") << -1 << "";
        QTest::newRow("nothing") << QByteArray() << -1 << "";
        QTest::newRow("empty") << QByteArray("[]") << 0 << "";
    }
    void connections()
    {
        QFETCH(QByteArray, json);
        QFETCH(int, count);
        QFETCH(QString, lastPrimary);
        const auto array = zent::parseConnectionArray(json);
        QCOMPARE(array ? array->size() : -1, count);
        QString text;
        for (const auto& c : zent::activeConnections(array.value_or(QJsonArray()))) {
            if (c.primary)
                text = c.hwAddress + c.speed + c.address + c.mask + c.gateway + c.dns;
        }
        QCOMPARE(text, lastPrimary);
    }

    void namingRules_data()
    {
        using State = PcNameRule::State;
        QTest::addColumn<QByteArray>("reply");
        QTest::addColumn<State>("state");
        QTest::addColumn<QString>("expression");
        const auto reply = [](const QJsonValue& message) {
            return QJsonDocument(QJsonObject{{"code", 0}, {"message", message}}).toJson();
        };
        QTest::newRow("given") << reply(R"({"regular_expression": "/a+/"})") << State::Given << "/a+/";
        QTest::newRow("empty rule") << reply(R"({"regular_expression": ""})") << State::Given << "";
        QTest::newRow("no rule") << reply(R"({"other": 1})") << State::Missing << "";
        QTest::newRow("rule a number") << reply(R"({"regular_expression": 4})") << State::Missing << "";
        QTest::newRow("inner an array") << reply("[]") << State::Missing << "";
        QTest::newRow("inner broken") << reply("[1,") << State::NotJson << "";
        QTest::newRow("inner an object") << reply(QJsonObject()) << State::NotJson << "";
        QTest::newRow("refused") << QByteArray(R"({"code": 3, "message": "{}"})") << State::Refused << "";
        QTest::newRow("no code") << QByteArray(R"({"message": "{}"})") << State::Refused << "";
        QTest::newRow("not json") << QByteArray("<html>") << State::NotJson << "";
    }
    void namingRules()
    {
        QFETCH(QByteArray, reply);
        QFETCH(PcNameRule::State, state);
        QFETCH(QString, expression);
        const PcNameRule rule = zent::parsePcNameRule(reply);
        QCOMPARE(rule.state, state);
        QCOMPARE(rule.expression, expression);
    }
};

QTEST_GUILESS_MAIN(TestFileConfig)
#include "test_fileconfig.moc"

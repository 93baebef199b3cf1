#include "logcapture.h"
#include "modifydialog.h"
#include "noticecloser.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"

#include <QLineEdit>
#include <QSignalSpy>
#include <QtTest>

namespace
{

const QString kNotChanged = QStringLiteral("修改密码失败");
const QString kChangedThere = QStringLiteral("密码修改成功");
const QString kScene = QStringLiteral("test-scene");
const QString kSceneConfig = QStringLiteral("/usr/share/lumo/test-scene/pc_config.json");

QByteArray json(const QJsonObject& object)
{
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

QByteArray sceneConfig(const QJsonValue& minimum)
{
    return json({{"pam_cracklib", QJsonObject{{"minlen", minimum}}}});
}

} // namespace

/// What the dialog does beside asking the identity service: the scene's length rule and the server's replies.
class TestPasswordReplies : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    QByteArray m_info;
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<NoticeCloser> m_notices;
    std::unique_ptr<ModifyDialog> m_dialog;
    QLineEdit* m_repeat = nullptr;

private slots:
    void initTestCase()
    {
        QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only");
        m_info = testfiles::read(zent::kUserinfoPath);
    }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        testfiles::write(zent::kUserinfoPath, m_info);
        testfiles::remove(QFileInfo(kSceneConfig).path());
        m_log = std::make_unique<LogCapture>();
        m_notices = std::make_unique<NoticeCloser>();
        m_dialog = std::make_unique<ModifyDialog>();
        m_dialog->setUserName("zhangsan", kScene);
        m_repeat = m_dialog->findChild<QLineEdit*>("rePasswordEdit");
    }
    void cleanup()
    {
        m_dialog.reset();
        m_notices.reset();
        m_log.reset();
    }

    void lengthRule_data()
    {
        QTest::addColumn<QByteArray>("config");
        QTest::addColumn<int>("shortest");
        QTest::newRow("no file") << QByteArray() << 8;
        QTest::newRow("broken") << QByteArray("{\"pam_cracklib\"") << 8;
        QTest::newRow("12") << sceneConfig(12) << 12;
        QTest::newRow("40") << sceneConfig(40) << 40;
        QTest::newRow("41") << sceneConfig(41) << 8;
        QTest::newRow("100") << sceneConfig(100) << 8;
        QTest::newRow("-1") << sceneConfig(-1) << 8;
        QTest::newRow("0") << sceneConfig(0) << 0;
        QTest::newRow("missing") << json({{"pam_cracklib", QJsonObject()}}) << 0;
        QTest::newRow("text") << sceneConfig("12") << 0;
        QTest::newRow("other shape") << QByteArray("[]") << 0;
    }
    void lengthRule()
    {
        QFETCH(QByteArray, config);
        QFETCH(int, shortest);
        if (!config.isEmpty())
            testfiles::write(kSceneConfig, config);
        m_repeat->setText(QString(shortest, QChar(0x5bc6)));
        QVERIFY(m_dialog->IsPasswordLenthValid());
        QVERIFY(m_log->contains(QString("passwd limit : %1").arg(shortest)));
        QCOMPARE(m_log->contains("no pc_config.json to use sceneCode: \"" + kScene + '"'), config.isEmpty());
        if (shortest > 0) {
            m_repeat->setText(QString(shortest - 1, 'x'));
            QVERIFY(!m_dialog->IsPasswordLenthValid());
        }
    }

    void lastLengthIsKept()
    {
        testfiles::write(kSceneConfig, sceneConfig(4));
        m_repeat->setText("1234");
        QVERIFY(m_dialog->IsPasswordLenthValid());
        m_dialog->setUserName("zhangsan", "scene-without-file");
        QVERIFY(m_dialog->IsPasswordLenthValid());
        m_repeat->setText("123");
        QVERIFY(!m_dialog->IsPasswordLenthValid());
        // A length of 0 passes anything only where a file says so.
        m_dialog->setUserName("zhangsan", kScene);
        testfiles::write(kSceneConfig, sceneConfig(0));
        QVERIFY(m_dialog->IsPasswordLenthValid());
        testfiles::remove(kSceneConfig);
        QVERIFY(!m_dialog->IsPasswordLenthValid());
    }

    void tokenReplacesOnlyTheToken()
    {
        QJsonObject expected = QJsonDocument::fromJson(m_info).object();
        QVERIFY(expected.size() > 1);
        for (const QString& token : {QStringLiteral("T-1.a\"b"), QStringLiteral("令牌")}) {
            m_dialog->renewToken(token);
            expected["token"] = token;
            QCOMPARE(QJsonDocument::fromJson(testfiles::read(zent::kUserinfoPath)).object(), expected);
        }
        QVERIFY(m_log->contains("file open successfully!"));
        QCOMPARE(m_notices->messages, QStringList());
        testfiles::write(zent::kUserinfoPath, "{\"other\": [1, {\"a\": null}]}");
        m_dialog->renewToken("T");
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(zent::kUserinfoPath)),
                 QJsonDocument::fromJson("{\"other\": [1, {\"a\": null}], \"token\": \"T\"}"));
    }

    void tokenWithoutAGoodFile_data()
    {
        QTest::addColumn<QByteArray>("content");
        QTest::addColumn<bool>("readable");
        QTest::newRow("missing") << QByteArray() << true;
        QTest::newRow("unreadable") << QByteArray("{\"token\": \"old\"}") << false;
        QTest::newRow("broken") << QByteArray("{\"token\": \"old\", ") << true;
        QTest::newRow("array") << QByteArray("[\"token\"]") << true;
    }
    void tokenWithoutAGoodFile()
    {
        QFETCH(QByteArray, content);
        QFETCH(bool, readable);
        testfiles::remove(zent::kUserinfoPath);
        if (!content.isEmpty())
            testfiles::write(zent::kUserinfoPath, content);
        QFile file(zent::kUserinfoPath);
        const auto permissions = file.permissions();
        if (!readable)
            QVERIFY(file.setPermissions(QFile::WriteOwner));
        m_dialog->renewToken("T");
        if (!readable)
            QVERIFY(file.setPermissions(permissions));
        QCOMPARE(file.exists(), !content.isEmpty());
        QCOMPARE(testfiles::read(zent::kUserinfoPath), content);
        QCOMPARE(m_notices->messages.size(), 1);
        const QString start = QStringLiteral("域管终端提示:读取/etc/zent/userinfo.json失败，错误原因是：");
        QVERIFY2(m_notices->messages.first().startsWith(start) && m_notices->messages.first() != start,
                 qPrintable(m_notices->messages.first()));
        const bool notOpened = content.isEmpty() || !readable;
        QCOMPARE(m_log->contains("no config.json to use, error code: "), notOpened);
        QCOMPARE(m_log->contains("file open failed!"), notOpened);
    }

    void serverReplies_data()
    {
        QTest::addColumn<QByteArray>("body");
        QTest::addColumn<QString>("token");
        QTest::addColumn<QString>("notice");
        QTest::newRow("good") << json({{"code", 0}, {"message", "T-new"}}) << "T-new" << kChangedThere;
        QTest::newRow("good, no token") << QByteArray("{\"code\": 0}") << "" << kChangedThere;
        QTest::newRow("refused") << json({{"code", 3}, {"data", "no <i>"}, {"message", "T"}}) << ""
                                 << "no <i>";
        QTest::newRow("refused, no data") << QByteArray("{\"code\": -1}") << ""
                                          << "";
        QTest::newRow("no code") << QByteArray("{\"message\": \"T\"}") << "" << kNotChanged;
        QTest::newRow("text code") << json({{"code", "0"}, {"message", "T"}}) << "" << kNotChanged;
        QTest::newRow("no whole code") << json({{"code", 0.5}, {"data", "half"}}) << ""
                                       << "half";
        QTest::newRow("array") << QByteArray("[{\"code\": 0}]") << "" << kNotChanged;
        QTest::newRow("not JSON") << QByteArray("<html>") << "" << kNotChanged;
        QTest::newRow("nothing") << QByteArray() << "" << kNotChanged;
    }
    void serverReplies()
    {
        QFETCH(QByteArray, body);
        QFETCH(QString, token);
        QFETCH(QString, notice);
        const bool good = notice == kChangedThere;
        m_dialog->show();
        QCOMPARE(m_dialog->analyseData(&body), good);
        QCOMPARE(m_notices->messages, QStringList{notice});
        QCOMPARE(m_dialog->isHidden(), good);
        QJsonObject expected = QJsonDocument::fromJson(m_info).object();
        if (!token.isEmpty())
            expected["token"] = token;
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(zent::kUserinfoPath)).object(), expected);
        if (!good) {
            QCOMPARE(m_platform.record("process").size(), 0);
            return;
        }
        QTRY_COMPARE(m_platform.record("process").size(), 1);
        const QJsonObject process = m_platform.record("process").first();
        const QJsonArray words = process.value("args").toArray();
        QCOMPARE(words.size(), 6);
        QCOMPARE(words.at(3), QJsonValue("/usr/share/lumo/scene/remove-cache.bash"));
        QVERIFY(process.value("token_ok").toBool());
    }

    void repliesOfEachStatus_data()
    {
        QTest::addColumn<int>("status");
        QTest::addColumn<int>("code");
        QTest::addColumn<QString>("line");
        QTest::newRow("good") << 200 << 0 << "parse config.json file ok.";
        QTest::newRow("refused") << 200 << 1 << "parse config.json file failed.";
        QTest::newRow("error") << 500 << 1 << "";
        QTest::newRow("error with a good body") << 500 << 0 << "";
    }
    void repliesOfEachStatus()
    {
        QFETCH(int, status);
        QFETCH(int, code);
        QFETCH(QString, line);
        m_platform.addFault({{"path", "/changed"}},
                            {{"status", status}, {"body", QString(json({{"code", code}, {"data", "d"}}))}});
        QNetworkAccessManager manager;
        const QPointer<QNetworkReply> reply = manager.get(QNetworkRequest(QUrl("http://127.0.0.1/changed")));
        QSignalSpy finished(reply, &QNetworkReply::finished);
        QVERIFY(finished.wait());
        m_dialog->onPasswordChecked(reply);
        QCOMPARE(m_notices->messages, QStringList{code == 0 ? kChangedThere : QStringLiteral("d")});
        QCOMPARE(m_log->count("parse config.json"), line.isEmpty() ? 0 : 1);
        QVERIFY(line.isEmpty() || m_log->contains(line));
        QTRY_VERIFY(!reply);
        if (code == 0)
            QTRY_COMPARE(m_platform.record("process").size(), 1);
    }

    void dialogThatGoesDuringANotice_data()
    {
        QTest::addColumn<bool>("tokenStored");
        QTest::newRow("success") << true;
        QTest::newRow("token not stored") << false;
    }
    void dialogThatGoesDuringANotice()
    {
        QFETCH(bool, tokenStored);
        if (!tokenStored)
            testfiles::remove(zent::kUserinfoPath);
        m_notices->instead = [this] { m_dialog.reset(); };
        m_dialog->show();
        QByteArray body = json({{"code", 0}, {"message", "T"}});
        QVERIFY(m_dialog->analyseData(&body));
        QVERIFY(!m_dialog);
        QCOMPARE(m_notices->messages.size(), 1);
        QTRY_COMPARE(m_platform.record("process").size(), 1);
    }
};

QTEST_MAIN(TestPasswordReplies)
#include "test_passwordreplies.moc"

#include "boxcloser.h"
#include "logcapture.h"
#include "modifydialog.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"
#include "testrows.h"
#include "toolkitpasswordedit.h"

#include <QPushButton>

namespace
{

const QString kOld = QStringLiteral("Zent@2026");
const QString kNew = QStringLiteral("Neu-%1\"\\密码8");
const QString kNotChanged = QStringLiteral("修改密码失败");
const QString kChangedThere = QStringLiteral("密码修改成功");

} // namespace

class TestModifyDialog : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    BoxCloser m_boxes;
    const QByteArray m_info = testfiles::read(zent::kUserinfoPath);
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<ModifyDialog> m_dialog;

    ToolkitPasswordEdit* edit(const char* name) const { return m_dialog->findChild<ToolkitPasswordEdit*>(name); }
    ToolkitPasswordEdit* old() const { return edit("oldPasswordEdit"); }
    ToolkitPasswordEdit* fresh() const { return edit("passwordEdit"); }
    ToolkitPasswordEdit* repeat() const { return edit("rePasswordEdit"); }
    QPushButton* confirm() const { return m_dialog->findChildren<QPushButton*>("confirm").value(0); }
    void fill(const QString& oldText, const QString& newText, const QString& repeated)
    {
        m_dialog->show();
        old()->setText(oldText);
        fresh()->setText(newText);
        repeat()->setText(repeated);
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        testfiles::write(zent::kUserinfoPath, m_info);
        m_boxes.texts.clear();
        m_log = std::make_unique<LogCapture>();
        m_dialog = std::make_unique<ModifyDialog>();
        m_dialog->setUserName("zhangsan", "test-scene");
    }
    void cleanup()
    {
        for (const QString& secret : {kOld, kNew})
            QVERIFY(!m_log->contains(secret));
        m_dialog.reset();
        m_log.reset();
    }

    void passwordsReachTheServiceAsTyped()
    {
        fill(kOld, kNew, "other");
        repeat()->setFocus();
        QTest::keyClick(repeat(), Qt::Key_Return);
        QVERIFY(m_platform.record("dbus").isEmpty());
        repeat()->setText(kNew);
        QTest::keyClick(repeat(), Qt::Key_Return);
        QCOMPARE(m_platform.record("dbus").value(0).value("args"),
                 QJsonValue(QJsonArray({qEnvironmentVariable("USER"), kOld, kNew})));
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(m_boxes.texts, QStringList());
        m_platform.patchState({{"users", QJsonObject{{"zhangsan", QJsonObject{{"password", kOld}}}}}});
    }

    void serviceAnswers_data()
    {
        addColumns<QJsonObject, QString, QStringList>("action", "alerts", "notices");
        const auto value = [](const QString& text) { return QJsonObject{{"value", text}}; };
        addRow("text code", value(R"({"code": "-500", "msg": "m"})"), "closes", QStringList());
        addRow("-500", value(R"({"code": -500, "msg": "<b>%1</b>"})"), "|<b>%1</b>", QStringList());
        addRow("-100002", value(R"({"code": -100002, "msg": "<b>%1</b>"})"), "<b>%1</b>|", QStringList());
        addRow("other", value(R"({"code": -1, "msg": "<b>%1</b>"})"), "|", QStringList("<b>%1</b>"));
        addRow("no code", value(R"({"Code": 0})"), "|", QStringList(kNotChanged));
        addRow("a number", QJsonObject{{"value", 0}, {"signature", "i"}}, "|", QStringList(kNotChanged));
        addRow("error", QJsonObject{{"error", "org.freedesktop.DBus.Error.AccessDenied"}}, "|",
               QStringList(kNotChanged));
        addRow("hangs until it ends", QJsonObject{{"vanish", true}, {"delay_ms", 500}}, "|", QStringList(kNotChanged));
    }
    void serviceAnswers()
    {
        QFETCH(QJsonObject, action);
        QFETCH(QString, alerts);
        QFETCH(QStringList, notices);
        const bool closes = alerts == "closes";
        m_platform.addFault({{"dbus", "ModifyUserPassword"}}, action);
        fill(kOld, kNew, kNew);
        confirm()->click();
        m_platform.patchState({{"services", QJsonObject{{"iam", true}}}});
        QCOMPARE(m_dialog->isHidden(), closes);
        QCOMPARE(old()->alertMessage() + '|' + fresh()->alertMessage(), closes ? QString("|") : alerts);
        QCOMPARE(m_boxes.texts, notices);
        QCOMPARE(repeat()->text(), closes ? QString() : kNew);
    }

    void everyOpeningStartsEmpty()
    {
        for (const bool byKey : {true, false}) {
            fill("a", "abc", "abd");
            m_dialog->onRepasswordeditFinished();
            QVERIFY(repeat()->isAlert());
            if (byKey)
                QTest::keyClick(m_dialog.get(), Qt::Key_Escape);
            else
                m_dialog->close();
            QVERIFY(m_dialog->isHidden() && !repeat()->isAlert());
            // Not only before the next opening: nothing typed stays in the memory of a closed dialog.
            QCOMPARE(old()->text() + fresh()->text() + repeat()->text(), QString());
        }
    }

    void serverReplies_data()
    {
        addColumns<QString, QString, QString>("body", "token", "notice");
        addRow("good", "{\"code\": 0, \"message\": \"T-1.a\\\"b令牌\"}", "T-1.a\"b令牌", kChangedThere);
        addRow("good, no token", R"({"code": 0})", "", kChangedThere);
        addRow("refused", R"({"code": 3, "data": "no <i>", "message": "T"})", "", "no <i>");
        addRow("text code", R"({"code": "0", "message": "T"})", "", kNotChanged);
    }
    void serverReplies()
    {
        QFETCH(QString, body);
        QFETCH(QString, token);
        QFETCH(QString, notice);
        const bool good = notice == kChangedThere;
        m_dialog->show();
        QByteArray reply = body.toUtf8();
        QCOMPARE(m_dialog->analyseData(&reply), good);
        QCOMPARE(m_boxes.texts, QStringList{notice});
        QCOMPARE(m_dialog->isHidden(), good);
        QJsonObject expected = QJsonDocument::fromJson(m_info).object();
        if (!token.isEmpty())
            expected["token"] = token;
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(zent::kUserinfoPath)).object(), expected);
        QTRY_COMPARE(m_platform.record("process").size(), good ? 1 : 0);
        QCOMPARE(m_platform.record("process").value(0).value("token_ok").toBool(), good);
    }

    void tokenWithoutAGoodFile()
    {
        for (const char* content : {"", "{\"token\": \"old\", ", "[\"token\"]"}) {
            testfiles::remove(zent::kUserinfoPath);
            if (*content)
                testfiles::write(zent::kUserinfoPath, content);
            m_boxes.texts.clear();
            m_dialog->renewToken("T");
            QCOMPARE(QFile::exists(zent::kUserinfoPath), *content != '\0');
            QCOMPARE(testfiles::read(zent::kUserinfoPath), QByteArray(content));
            QCOMPARE(m_boxes.texts.filter("域管终端提示").size(), 1);
        }
        // The dialog may go while the first notice is open.
        QByteArray body("{\"code\": 0, \"message\": \"T\"}");
        m_boxes.texts.clear();
        m_boxes.instead = [this] { m_dialog.reset(); };
        QVERIFY(m_dialog->analyseData(&body));
        QVERIFY(!m_dialog);
        QCOMPARE(m_boxes.texts.size(), 1);
    }
};

QTEST_MAIN(TestModifyDialog)
#include "test_modifydialog.moc"

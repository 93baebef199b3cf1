#include "logcapture.h"
#include "modifydialog.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"
#include "toolkitpasswordedit.h"

#include <QApplication>
#include <QPushButton>
#include <QtTest>

namespace
{

const QString kOld = QStringLiteral("Zent@2026");
const QString kNew = QStringLiteral("Neu-%1\"\\密码8");
const QString kNotChanged = QStringLiteral("修改密码失败");
const QString kChangedThere = QStringLiteral("密码修改成功");
const QString kMismatch = QStringLiteral("密码不一致");
const QString kScene = QStringLiteral("test-scene");
const QString kSceneConfig = QStringLiteral("/usr/share/lumo/test-scene/pc_config.json");
const QJsonObject kTheCall{{"dbus", "ModifyUserPassword"}};

QByteArray json(const QJsonObject& object)
{
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

QByteArray sceneConfig(const QJsonValue& minimum)
{
    return json({{"pam_cracklib", QJsonObject{{"minlen", minimum}}}});
}

} // namespace

class TestModifyDialog : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    QByteArray m_info;
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<ModifyDialog> m_dialog;
    /// The messages of the notices that were closed, each after its title and a colon.
    QStringList m_notices;
    /// Whether the next notice takes the dialog away before it is closed.
    bool m_dropDialog = false;

    ToolkitPasswordEdit* edit(const char* name) const { return m_dialog->findChild<ToolkitPasswordEdit*>(name); }
    ToolkitPasswordEdit* old() const { return edit("oldPasswordEdit"); }
    ToolkitPasswordEdit* fresh() const { return edit("passwordEdit"); }
    ToolkitPasswordEdit* repeat() const { return edit("rePasswordEdit"); }
    QPushButton* button(const QString& text) const
    {
        for (QPushButton* candidate : m_dialog->findChildren<QPushButton*>("confirm")) {
            if (candidate->text() == text)
                return candidate;
        }
        return nullptr;
    }
    QPushButton* confirm() const { return button(QStringLiteral("确认")); }

    void open()
    {
        m_dialog->show();
        QVERIFY(QTest::qWaitForWindowActive(m_dialog.get()));
    }
    void fill(const QString& oldText, const QString& newText, const QString& repeated)
    {
        old()->setText(oldText);
        fresh()->setText(newText);
        repeat()->setText(repeated);
    }
    QList<QJsonObject> calls()
    {
        QList<QJsonObject> result;
        for (const QJsonObject& entry : m_platform.record("dbus")) {
            if (entry.value("method") == kTheCall.value("dbus"))
                result.append(entry);
        }
        return result;
    }
    /// Closes every notice that comes while the dialog lives, as a user would.
    void closeNotices()
    {
        auto* watch = new QTimer(this);
        connect(watch, &QTimer::timeout, this, [this] {
            auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
            if (!box)
                return;
            m_notices += (box->windowTitle().isEmpty() ? "" : box->windowTitle() + ':') + box->message();
            if (m_dropDialog)
                return m_dialog.reset();
            QTest::keyClick(box, Qt::Key_Return);
        });
        watch->start(5);
    }

private slots:
    void initTestCase()
    {
        QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only");
        m_info = testfiles::read(zent::kUserinfoPath);
        closeNotices();
    }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        testfiles::write(zent::kUserinfoPath, m_info);
        testfiles::remove(QFileInfo(kSceneConfig).path());
        m_notices.clear();
        m_dropDialog = false;
        m_log = std::make_unique<LogCapture>();
        m_dialog = std::make_unique<ModifyDialog>();
        m_dialog->setUserName("zhangsan", kScene);
    }
    void cleanup()
    {
        for (const QString& secret : {kOld, kNew})
            QVERIFY(!m_log->contains(secret));
        m_dialog.reset();
        m_log.reset();
    }

    void buttonNeedsThreeFields_data()
    {
        QTest::addColumn<QStringList>("texts");
        QTest::addColumn<bool>("enabled");
        QTest::newRow("all") << QStringList{"a", "b", "b"} << true;
        QTest::newRow("same as the old") << QStringList{"a", "a", "a"} << true;
        QTest::newRow("blanks") << QStringList{" ", " ", " "} << true;
        QTest::newRow("nothing") << QStringList{"", "", ""} << false;
        QTest::newRow("no old") << QStringList{"", "b", "b"} << false;
        QTest::newRow("no new") << QStringList{"a", "", ""} << false;
        QTest::newRow("no repeat") << QStringList{"a", "b", ""} << false;
        QTest::newRow("repeat only") << QStringList{"a", "", "b"} << false;
        QTest::newRow("other repeat") << QStringList{"a", "abc", "abd"} << false;
        QTest::newRow("other case") << QStringList{"a", "abc", "ABC"} << false;
        QTest::newRow("longer repeat") << QStringList{"a", "abc", "abc "} << false;
    }
    void buttonNeedsThreeFields()
    {
        QFETCH(QStringList, texts);
        QFETCH(bool, enabled);
        QVERIFY(!confirm()->isEnabled());
        // Whichever field is filled last decides.
        const QVector<QVector<int>> orders{{0, 1, 2}, {2, 1, 0}, {1, 2, 0}};
        for (const QVector<int>& order : orders) {
            fill("x", "y", "y");
            QVERIFY(confirm()->isEnabled());
            for (int field : order)
                QVector<QLineEdit*>{old(), fresh(), repeat()}[field]->setText(texts[field]);
            QCOMPARE(confirm()->isEnabled(), enabled);
        }
    }

    void mismatchIsToldAndTakenBack()
    {
        open();
        fill(kOld, "abc", "abd");
        const QRect place = fresh()->geometry();
        repeat()->setFocus();
        QVERIFY(!repeat()->isAlert());
        QTest::keyClick(repeat(), Qt::Key_Tab);
        QVERIFY(repeat()->isAlert());
        QCOMPARE(repeat()->alertMessage(), kMismatch);
        QCOMPARE(fresh()->geometry(), place);
        repeat()->setText("abc");
        QVERIFY(!repeat()->isAlert());
        QCOMPARE(repeat()->alertMessage(), QString());
        QVERIFY(confirm()->isEnabled());

        repeat()->setText("abd");
        m_dialog->onRepasswordeditFinished();
        QVERIFY(repeat()->isAlert());
        // The other field can end the difference too.
        fresh()->setText("abd");
        QVERIFY(!repeat()->isAlert());
        QVERIFY(confirm()->isEnabled());
    }

    void tabAndEnter()
    {
        open();
        QCOMPARE(m_dialog->focusWidget(), old());
        QTest::keyClicks(m_dialog->focusWidget(), kOld);
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Return);
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Tab);
        QCOMPARE(m_dialog->focusWidget(), fresh());
        QTest::keyClicks(m_dialog->focusWidget(), "Abcdef#9");
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Tab);
        QCOMPARE(m_dialog->focusWidget(), repeat());
        QTest::keyClicks(m_dialog->focusWidget(), "Abcdef#9");
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Tab);
        QCOMPARE(m_dialog->focusWidget(), confirm());
        QCOMPARE(calls().size(), 0);
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Backtab);
        QCOMPARE(m_dialog->focusWidget(), repeat());
        m_platform.addFault(kTheCall, {{"value", "{\"code\": 0}"}});
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Return);
        QCOMPARE(calls().size(), 1);
        QVERIFY(m_dialog->isHidden());
    }

    void passwordsReachTheServiceAsTyped()
    {
        open();
        fill(kOld, kNew, kNew);
        const QJsonValue before = m_platform.state().value("users").toObject().value("zhangsan");
        QCOMPARE(before.toObject().value("password"), QJsonValue(kOld));
        confirm()->click();
        QCOMPARE(calls().size(), 1);
        const QJsonObject call = calls().first();
        QCOMPARE(call.value("args").toArray(), QJsonArray({"zhangsan", kOld, kNew}));
        QCOMPARE(call.value("bus"), QJsonValue("system"));
        const QJsonValue after = m_platform.state().value("users").toObject().value("zhangsan");
        QCOMPARE(after.toObject().value("password"), QJsonValue(kNew));
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(m_notices, QStringList());
        QVERIFY(m_log->contains(QStringLiteral("修改密码成功")));

        open();
        fill("wrong", kNew, kNew);
        confirm()->click();
        QCOMPARE(old()->alertMessage(), QStringLiteral("旧密码错误"));
        fill(kNew, "short", "short");
        confirm()->click();
        QVERIFY(!fresh()->alertMessage().isEmpty());
        QVERIFY(m_dialog->isVisible());
        QCOMPARE(repeat()->text(), QString("short"));
        m_platform.patchState({{"users", QJsonObject{{"zhangsan", QJsonObject{{"password", kOld}}}}}});
    }

    void serviceAnswers_data()
    {
        QTest::addColumn<QJsonObject>("action");
        QTest::addColumn<bool>("closes");
        QTest::addColumn<QString>("oldAlert");
        QTest::addColumn<QString>("newAlert");
        QTest::addColumn<QStringList>("notices");
        const auto value = [](const QString& text) { return QJsonObject{{"value", text}}; };
        const auto coded = [&value](const QJsonValue& code) {
            return value(json({{"code", code}, {"msg", "<b>%1</b> msg"}}));
        };
        const QString message = QStringLiteral("<b>%1</b> msg");
        const QStringList failed{kNotChanged};
        QTest::newRow("0") << coded(0) << true << ""
                           << "" << QStringList();
        QTest::newRow("text code") << coded("-500") << true << ""
                                   << "" << QStringList();
        QTest::newRow("null code") << coded(QJsonValue()) << true << ""
                                   << "" << QStringList();
        QTest::newRow("-500") << coded(-500) << false << "" << message << QStringList();
        QTest::newRow("-100002") << coded(-100002) << false << message << "" << QStringList();
        QTest::newRow("other") << coded(-1) << false << ""
                               << "" << QStringList{message};
        QTest::newRow("other, no msg") << value("{\"code\": 7}") << false << ""
                                       << "" << QStringList{QString()};
        QTest::newRow("-500, no msg") << value("{\"code\": -500}") << false << ""
                                      << "" << QStringList();
        QTest::newRow("no code") << value("{\"msg\": \"x\"}") << false << ""
                                 << "" << failed;
        QTest::newRow("other case") << value("{\"Code\": 0}") << false << ""
                                    << "" << failed;
        QTest::newRow("not JSON") << value("ok") << false << ""
                                  << "" << failed;
        QTest::newRow("nothing") << value("") << false << ""
                                 << "" << failed;
        QTest::newRow("array") << value("[{\"code\": 0}]") << false << ""
                               << "" << failed;
        QTest::newRow("no argument") << QJsonObject{{"no_value", true}} << false << ""
                                     << "" << failed;
        QTest::newRow("error") << QJsonObject{{"error", "org.freedesktop.DBus.Error.AccessDenied"}} << false << ""
                               << "" << failed;
        QTest::newRow("vanishes") << QJsonObject{{"vanish", true}} << false << ""
                                  << "" << failed;
        QTest::newRow("absent") << QJsonObject() << false << ""
                                << "" << failed;
    }
    void serviceAnswers()
    {
        QFETCH(QJsonObject, action);
        QFETCH(bool, closes);
        QFETCH(QString, oldAlert);
        QFETCH(QString, newAlert);
        QFETCH(QStringList, notices);
        if (action.isEmpty())
            m_platform.patchState({{"services", QJsonObject{{"iam", false}}}});
        else
            m_platform.addFault(kTheCall, action);
        open();
        fill(kOld, kNew, kNew);
        confirm()->click();
        m_platform.patchState({{"services", QJsonObject{{"iam", true}}}});
        QCOMPARE(m_dialog->isHidden(), closes);
        QCOMPARE(old()->alertMessage(), oldAlert);
        QCOMPARE(fresh()->alertMessage(), newAlert);
        QCOMPARE(m_notices, notices);
        QCOMPARE(m_log->contains(QStringLiteral("pam模块返回数据错误,修改密码失败")), notices.contains(kNotChanged));
        QCOMPARE(repeat()->text(), closes ? QString() : kNew);
        QCOMPARE(m_platform.record("process").size(), 0);
    }

    void everyOpeningStartsEmpty_data()
    {
        QTest::addColumn<QString>("how");
        for (const char* how : {"取消", "escape", "close"})
            QTest::newRow(how) << QString(how);
    }
    void everyOpeningStartsEmpty()
    {
        QFETCH(QString, how);
        open();
        fill("a", "abc", "abd");
        repeat()->setFocus();
        m_dialog->onRepasswordeditFinished();
        if (how == "escape")
            QTest::keyClick(m_dialog.get(), Qt::Key_Escape);
        else if (how == "close")
            m_dialog->close();
        else
            button(how)->click();
        QVERIFY(m_dialog->isHidden());
        open();
        QCOMPARE(old()->text() + fresh()->text() + repeat()->text(), QString());
        QVERIFY(!confirm()->isEnabled());
        QVERIFY(!repeat()->isAlert());
        QCOMPARE(repeat()->alertMessage(), QString());
        QCOMPARE(m_dialog->focusWidget(), old());
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
        repeat()->setText(QString(shortest, QChar(0x5bc6)));
        QVERIFY(m_dialog->IsPasswordLenthValid());
        QVERIFY(m_log->contains(QString("passwd limit : %1").arg(shortest)));
        QCOMPARE(m_log->contains("no pc_config.json to use sceneCode: \"" + kScene + '"'), config.isEmpty());
        if (shortest > 0) {
            repeat()->setText(QString(shortest - 1, 'x'));
            QVERIFY(!m_dialog->IsPasswordLenthValid());
        }
    }

    void lastLengthIsKept()
    {
        testfiles::write(kSceneConfig, sceneConfig(4));
        repeat()->setText("1234");
        QVERIFY(m_dialog->IsPasswordLenthValid());
        m_dialog->setUserName("zhangsan", "scene-without-file");
        QVERIFY(m_dialog->IsPasswordLenthValid());
        repeat()->setText("123");
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
        QCOMPARE(m_notices, QStringList());
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
        QCOMPARE(m_notices.size(), 1);
        const QString start = QStringLiteral("域管终端提示:读取/etc/zent/userinfo.json失败，错误原因是：");
        QVERIFY2(m_notices.first().startsWith(start) && m_notices.first() != start, qPrintable(m_notices.first()));
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
        open();
        fill("a", "b", "b");
        QCOMPARE(m_dialog->analyseData(&body), good);
        QCOMPARE(m_notices, QStringList{notice});
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
        QCOMPARE(m_notices, QStringList{code == 0 ? kChangedThere : QStringLiteral("d")});
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
        m_dropDialog = true;
        open();
        QByteArray body = json({{"code", 0}, {"message", "T"}});
        QVERIFY(m_dialog->analyseData(&body));
        QVERIFY(!m_dialog);
        QCOMPARE(m_notices.size(), 1);
        QTRY_COMPARE(m_platform.record("process").size(), 1);
    }
};

QTEST_MAIN(TestModifyDialog)
#include "test_modifydialog.moc"

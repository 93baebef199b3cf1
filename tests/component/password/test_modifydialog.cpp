#include "logcapture.h"
#include "modifydialog.h"
#include "noticecloser.h"
#include "platformcontrol.h"
#include "toolkitpasswordedit.h"

#include <QPushButton>
#include <QtTest>

namespace
{

const QString kOld = QStringLiteral("Zent@2026");
const QString kNew = QStringLiteral("Neu-%1\"\\密码8");
const QString kNotChanged = QStringLiteral("修改密码失败");
const QString kMismatch = QStringLiteral("密码不一致");
const QJsonObject kTheCall{{"dbus", "ModifyUserPassword"}};

QByteArray json(const QJsonObject& object)
{
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

} // namespace

class TestModifyDialog : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<ModifyDialog> m_dialog;
    std::unique_ptr<NoticeCloser> m_notices;

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

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        m_notices = std::make_unique<NoticeCloser>();
        m_log = std::make_unique<LogCapture>();
        m_dialog = std::make_unique<ModifyDialog>();
        m_dialog->setUserName("zhangsan", "intranet-scene");
    }
    void cleanup()
    {
        for (const QString& secret : {kOld, kNew})
            QVERIFY(!m_log->contains(secret));
        m_dialog.reset();
        m_notices.reset();
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
        QCOMPARE(call.value("args").toArray(), QJsonArray({qEnvironmentVariable("USER"), kOld, kNew}));
        QCOMPARE(call.value("bus"), QJsonValue("system"));
        const QJsonValue after = m_platform.state().value("users").toObject().value("zhangsan");
        QCOMPARE(after.toObject().value("password"), QJsonValue(kNew));
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(m_notices->messages, QStringList());
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
        QCOMPARE(m_notices->messages, notices);
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
};

QTEST_MAIN(TestModifyDialog)
#include "test_modifydialog.moc"

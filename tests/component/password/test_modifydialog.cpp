#include "logcapture.h"
#include "modifydialog.h"
#include "paths.h"
#include "platformcontrol.h"
#include "testfiles.h"
#include "testrows.h"
#include "toolkitpasswordedit.h"

#include <QApplication>
#include <QPushButton>
#include <QSignalSpy>
#include <QTimer>

namespace
{

const QString kOld = QStringLiteral("Zent@2026");
const QString kNew = QStringLiteral("Neu-%1\"\\密码8");
const QString kNotChanged = QStringLiteral("修改密码失败");
const QString kChangedThere = QStringLiteral("密码修改成功");
const QString kSceneConfig = QStringLiteral("/usr/share/lumo/test-scene/pc_config.json");
const QJsonObject kTheCall{{"dbus", "ModifyUserPassword"}};

QString json(const QJsonObject& object)
{
    return QString::fromUtf8(QJsonDocument(object).toJson(QJsonDocument::Compact));
}

} // namespace

class TestModifyDialog : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    QByteArray m_info;
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<ModifyDialog> m_dialog;
    QTimer m_noticeTimer;
    /// What the notices said, each after its title and a colon where it had one.
    QStringList m_notices;
    bool m_dialogGoesDuringANotice = false;

    ToolkitPasswordEdit* edit(const char* name) const { return m_dialog->findChild<ToolkitPasswordEdit*>(name); }
    ToolkitPasswordEdit* old() const { return edit("oldPasswordEdit"); }
    ToolkitPasswordEdit* fresh() const { return edit("passwordEdit"); }
    ToolkitPasswordEdit* repeat() const { return edit("rePasswordEdit"); }
    QPushButton* confirm() const { return m_dialog->findChildren<QPushButton*>("confirm").value(0); }

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
    /// The arguments of the calls to the identity service.
    QJsonArray calls()
    {
        QJsonArray result;
        for (const QJsonObject& entry : m_platform.record("dbus")) {
            if (entry.value("method") == kTheCall.value("dbus") && entry.value("bus") == "system")
                result.append(entry.value("args"));
        }
        return result;
    }
    static QJsonObject info() { return QJsonDocument::fromJson(testfiles::read(zent::kUserinfoPath)).object(); }
    /// Closes the notice that is open, as a user would.
    void closeNotice()
    {
        auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
        if (!box)
            return;
        m_notices += (box->windowTitle().isEmpty() ? "" : box->windowTitle() + ':') + box->message();
        if (m_dialogGoesDuringANotice)
            m_dialog.reset();
        else
            QTest::keyClick(box, Qt::Key_Return);
    }

private slots:
    void initTestCase()
    {
        QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only");
        m_info = testfiles::read(zent::kUserinfoPath);
        QVERIFY(info().size() > 1);
        connect(&m_noticeTimer, &QTimer::timeout, this, &TestModifyDialog::closeNotice);
        m_noticeTimer.start(5);
    }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        testfiles::write(zent::kUserinfoPath, m_info);
        testfiles::remove(kSceneConfig);
        m_notices.clear();
        m_dialogGoesDuringANotice = false;
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

    void buttonNeedsThreeFields()
    {
        QVERIFY(!confirm()->isEnabled());
        const QList<QPair<QStringList, bool>> cases{
            {{"a", "b", "b"}, true}, {{" ", " ", " "}, true}, {{"", "b", "b"}, false},  {{"a", "", ""}, false},
            {{"a", "b", ""}, false}, {{"a", "", "b"}, false}, {{"a", "b", "B"}, false}, {{"a", "b", "b "}, false},
        };
        const QList<QLineEdit*> edits{old(), fresh(), repeat()};
        for (const auto& [texts, enabled] : cases) {
            // Whichever field is filled last decides.
            for (int last : {0, 1, 2}) {
                fill("x", "y", "y");
                QVERIFY(confirm()->isEnabled());
                for (int field : {last + 1, last + 2, last})
                    edits[field % 3]->setText(texts[field % 3]);
                QVERIFY2(confirm()->isEnabled() == enabled, qPrintable(texts.join('|')));
            }
        }
    }

    void mismatchIsToldAndTakenBack()
    {
        open();
        fill(kOld, "abc", "abd");
        repeat()->setFocus();
        QVERIFY(!repeat()->isAlert());
        QTest::keyClick(repeat(), Qt::Key_Tab);
        QVERIFY(repeat()->isAlert());
        QCOMPARE(repeat()->alertMessage(), QStringLiteral("密码不一致"));
        // Either field can end the difference.
        for (ToolkitPasswordEdit* field : {repeat(), fresh()}) {
            fresh()->setText("abc");
            repeat()->setText("abd");
            m_dialog->onRepasswordeditFinished();
            QVERIFY(repeat()->isAlert());
            field->setText(field == fresh() ? "abd" : "abc");
            QVERIFY(!repeat()->isAlert());
            QCOMPARE(repeat()->alertMessage(), QString());
            QVERIFY(confirm()->isEnabled());
        }
    }

    void passwordsReachTheServiceAsTyped()
    {
        open();
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Return);
        QCOMPARE(calls(), QJsonArray());
        for (const QString& text : {kOld, kNew, kNew}) {
            qobject_cast<QLineEdit*>(m_dialog->focusWidget())->insert(text);
            QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Tab);
        }
        QCOMPARE(m_dialog->focusWidget(), confirm());
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Backtab);
        QTest::keyClick(m_dialog->focusWidget(), Qt::Key_Return);
        QCOMPARE(calls(), QJsonArray({QJsonArray({qEnvironmentVariable("USER"), kOld, kNew})}));
        const QJsonObject user = m_platform.state().value("users").toObject().value("zhangsan").toObject();
        QCOMPARE(user.value("password"), QJsonValue(kNew));
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(m_notices, QStringList());
        m_platform.patchState({{"users", QJsonObject{{"zhangsan", QJsonObject{{"password", kOld}}}}}});
    }

    void serviceAnswers_data()
    {
        addColumns<QJsonObject, QString, QString>("action", "alerts", "notice");
        const auto value = [](const QString& text) { return QJsonObject{{"value", text}}; };
        const auto coded = [&value](const QJsonValue& code) {
            return value(json({{"code", code}, {"msg", "<b>%1</b> msg"}}));
        };
        addRow("0", coded(0), "closes", "none");
        addRow("text code", coded("-500"), "closes", "none");
        addRow("-500", coded(-500), "|<b>%1</b> msg", "none");
        addRow("-100002", coded(-100002), "<b>%1</b> msg|", "none");
        addRow("other", coded(-1), "|", "<b>%1</b> msg");
        addRow("other, no msg", value("{\"code\": 7}"), "|", "");
        addRow("no code", value("{\"Code\": 0}"), "|", kNotChanged);
        addRow("not JSON", value("ok"), "|", kNotChanged);
        addRow("array", value("[{\"code\": 0}]"), "|", kNotChanged);
        addRow("no argument", QJsonObject{{"no_value", true}}, "|", kNotChanged);
        addRow("error", QJsonObject{{"error", "org.freedesktop.DBus.Error.AccessDenied"}}, "|", kNotChanged);
        addRow("a number", QJsonObject{{"value", 0}, {"signature", "i"}}, "|", kNotChanged);
        addRow("vanishes", QJsonObject{{"vanish", true}}, "|", kNotChanged);
        addRow("hangs until it ends", QJsonObject{{"vanish", true}, {"delay_ms", 500}}, "|", kNotChanged);
        addRow("absent", QJsonObject(), "|", kNotChanged);
    }
    void serviceAnswers()
    {
        QFETCH(QJsonObject, action);
        QFETCH(QString, alerts);
        QFETCH(QString, notice);
        const bool closes = alerts == "closes";
        if (action.isEmpty())
            m_platform.patchState({{"services", QJsonObject{{"iam", false}}}});
        else
            m_platform.addFault(kTheCall, action);
        open();
        fill(kOld, kNew, kNew);
        confirm()->click();
        m_platform.patchState({{"services", QJsonObject{{"iam", true}}}});
        QCOMPARE(m_dialog->isHidden(), closes);
        QCOMPARE(m_log->contains("pam模块返回数据错误,修改密码失败"), notice == kNotChanged);
        QCOMPARE(old()->alertMessage() + '|' + fresh()->alertMessage(), closes ? QString("|") : alerts);
        QCOMPARE(m_notices, notice == "none" ? QStringList() : QStringList{notice});
        QCOMPARE(repeat()->text(), closes ? QString() : kNew);
    }

    void everyOpeningStartsEmpty()
    {
        const std::function<void()> ways[]{
            [this] { m_dialog->findChildren<QPushButton*>("confirm").value(1)->click(); },
            [this] { QTest::keyClick(m_dialog.get(), Qt::Key_Escape); },
            [this] { m_dialog->close(); },
        };
        for (const auto& close : ways) {
            open();
            QCOMPARE(m_dialog->focusWidget(), old());
            QVERIFY(!confirm()->isEnabled());
            QVERIFY(!repeat()->isAlert());
            QCOMPARE(repeat()->alertMessage(), QString());
            fill("a", "abc", "abd");
            repeat()->setFocus();
            m_dialog->onRepasswordeditFinished();
            close();
            QVERIFY(m_dialog->isHidden());
            // Not only before the next opening: nothing typed stays in the memory of a closed dialog.
            QCOMPARE(old()->text() + fresh()->text() + repeat()->text(), QString());
        }
    }

    void lengthRule_data()
    {
        addColumns<QString, int>("config", "shortest");
        const auto minimum = [](const QJsonValue& length) {
            return json({{"pam_cracklib", QJsonObject{{"minlen", length}}}});
        };
        addRow("no file", "", 8);
        addRow("broken", "{\"pam_cracklib\"", 8);
        addRow("40", minimum(40), 40);
        addRow("41", minimum(41), 8);
        addRow("-1", minimum(-1), 8);
        addRow("0", minimum(0), 0);
        addRow("text", minimum("12"), 0);
        addRow("missing", "{}", 0);
    }
    void lengthRule()
    {
        QFETCH(QString, config);
        QFETCH(int, shortest);
        if (!config.isEmpty())
            testfiles::write(kSceneConfig, config.toUtf8());
        repeat()->setText(QString(shortest, QChar(0x5bc6)));
        QVERIFY(m_dialog->IsPasswordLenthValid());
        repeat()->setText(QString(std::max(shortest - 1, 0), 'x'));
        QCOMPARE(m_dialog->IsPasswordLenthValid(), shortest == 0);
        // The last length holds on where there is no file, but a length of 0 passes only where a file says so.
        testfiles::remove(kSceneConfig);
        QVERIFY(!m_dialog->IsPasswordLenthValid());
        repeat()->setText(QString(shortest, 'x'));
        QCOMPARE(m_dialog->IsPasswordLenthValid(), shortest > 0);
    }

    void serverReplies_data()
    {
        addColumns<int, QString, QString, QString>("status", "body", "token", "notice");
        addRow("good", 200, json({{"code", 0}, {"message", "T-1.a\"b令牌"}}), "T-1.a\"b令牌", kChangedThere);
        addRow("good, no token", 200, "{\"code\": 0}", "", kChangedThere);
        addRow("error with a good body", 500, "{\"code\": 0, \"message\": \"T\"}", "T", kChangedThere);
        addRow("refused", 200, json({{"code", 3}, {"data", "no <i>"}, {"message", "T"}}), "", "no <i>");
        addRow("refused, no data", 500, "{\"code\": -1}", "", "");
        addRow("no whole code", 200, "{\"code\": 0.5, \"data\": \"half\"}", "", "half");
        addRow("no code", 200, "{\"message\": \"T\"}", "", kNotChanged);
        addRow("text code", 200, "{\"code\": \"0\", \"message\": \"T\"}", "", kNotChanged);
        addRow("array", 200, "[{\"code\": 0}]", "", kNotChanged);
        addRow("not JSON", 200, "<html>", "", kNotChanged);
        addRow("nothing", 200, "", "", kNotChanged);
    }
    void serverReplies()
    {
        QFETCH(int, status);
        QFETCH(QString, body);
        QFETCH(QString, token);
        QFETCH(QString, notice);
        const bool good = notice == kChangedThere;
        m_platform.addFault({{"path", "/changed"}}, {{"status", status}, {"body", body}});
        QNetworkAccessManager manager;
        const QPointer<QNetworkReply> reply = manager.get(QNetworkRequest(QUrl("http://127.0.0.1/changed")));
        QSignalSpy finished(reply, &QNetworkReply::finished);
        QVERIFY(finished.wait());
        m_dialog->show();
        m_dialog->onPasswordChecked(reply);
        QCOMPARE(m_notices, QStringList{notice});
        QCOMPARE(m_dialog->isHidden(), good);
        QJsonObject expected = QJsonDocument::fromJson(m_info).object();
        if (!token.isEmpty())
            expected["token"] = token;
        QCOMPARE(info(), expected);
        QTRY_VERIFY(!reply);
        QTRY_COMPARE(m_platform.record("process").size(), good ? 1 : 0);
        if (!good)
            return;
        const QJsonObject process = m_platform.record("process").first();
        QCOMPARE(process.value("args").toArray().at(3), QJsonValue("/usr/share/lumo/scene/remove-cache.bash"));
        QVERIFY(process.value("token_ok").toBool());
    }

    void tokenWithoutAGoodFile()
    {
        const QRegularExpression told(QStringLiteral("^域管终端提示:读取/etc/zent/userinfo.json失败，错误原因是：."));
        for (const char* content : {"", "{\"token\": \"old\", ", "[\"token\"]"}) {
            testfiles::remove(zent::kUserinfoPath);
            if (*content)
                testfiles::write(zent::kUserinfoPath, content);
            m_dialog->renewToken("T");
            QCOMPARE(QFile::exists(zent::kUserinfoPath), *content != '\0');
            QCOMPARE(testfiles::read(zent::kUserinfoPath), QByteArray(content));
            QCOMPARE(m_notices.filter(told), m_notices);
            QCOMPARE(m_notices.size(), 1);
            m_notices.clear();
        }
        QCOMPARE(m_log->count("no config.json to use, error code: "), 1);
    }

    void dialogThatGoesDuringANotice()
    {
        for (const bool tokenStored : {true, false}) {
            if (!tokenStored)
                testfiles::remove(zent::kUserinfoPath);
            m_dialog = std::make_unique<ModifyDialog>();
            m_dialogGoesDuringANotice = true;
            m_notices.clear();
            m_dialog->show();
            QByteArray body("{\"code\": 0, \"message\": \"T\"}");
            QVERIFY(m_dialog->analyseData(&body));
            QVERIFY(!m_dialog);
            QCOMPARE(m_notices.size(), 1);
        }
        QTRY_COMPARE(m_platform.record("process").size(), 2);
    }
};

QTEST_MAIN(TestModifyDialog)
#include "test_modifydialog.moc"

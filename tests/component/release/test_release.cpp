#include "closeguarddialog.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "paths.h"
#include "platformcontrol.h"
#include "spinerwin.h"
#include "terminalsettings.h"
#include "testfiles.h"
#include "testrows.h"
#include "thirdscript.h"
#include "toolkitpasswordedit.h"

#include <QApplication>
#include <QDirIterator>
#include <QElapsedTimer>
#include <QLabel>
#include <QPushButton>
#include <QSignalSpy>

namespace
{

const QString kUser = QStringLiteral("zhangsan");
const QString kAdministratorPassword = QStringLiteral("Admin@2026");
const QString kPromptText = QStringLiteral("当前终端已解除管控,重启后生效");
const QString kNetworkText = QStringLiteral("网络异常，请稍后重试");
const QString kSaid = QStringLiteral("服务器说明");
const QString kDirectoryScript = QStringLiteral("/usr/share/lumo/restore_ldap.bash");

/// A reply of the server with that result, unless it is undefined.
QJsonObject answer(int code, const QJsonValue& result, int status = 200)
{
    QJsonObject reply{{"code", code}, {"msg", kSaid}};
    if (!result.isUndefined())
        reply.insert("data", QJsonObject{{"result", result}});
    return {{"status", status}, {"body", QString::fromUtf8(QJsonDocument(reply).toJson())}};
}

} // namespace

class TestRelease : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<closeGuarddialog> m_dialog;
    QTimer m_boxTimer;
    QStringList m_boxes;
    QByteArray m_path;

    ToolkitPasswordEdit* password() const { return m_dialog->findChild<ToolkitPasswordEdit*>("password"); }
    spinerWin* spinner() const { return m_dialog->findChild<spinerWin*>(); }
    /// The visible widget of the spinner window with that text.
    template <typename Widget>
    Widget* shown(const QString& text) const
    {
        for (Widget* widget : spinner()->findChildren<Widget*>()) {
            if (widget->text() == text && widget->isVisible())
                return widget;
        }
        return nullptr;
    }
    QPushButton* spinnerButton(const QString& text) const { return shown<QPushButton>(text); }
    bool promptShown() const { return shown<QLabel>(kPromptText) && spinnerButton(QStringLiteral("立即重启")); }
    /// Closes the message box that is open, if one is, and keeps its text.
    void closeBox()
    {
        auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
        if (!box || qobject_cast<spinerWin*>(box))
            return;
        m_boxes.append(box->buttons().isEmpty() ? box->message() : QStringLiteral("box with buttons"));
        box->close();
    }
    void attempt(const QString& typed)
    {
        m_dialog->show();
        password()->setFocus();
        QTest::keyClicks(password(), typed);
        QTest::keyClick(password(), Qt::Key_Return);
    }
    /// The requests, in order.
    QStringList requests()
    {
        QStringList rows;
        for (const QJsonObject& entry : m_platform.record("http")) {
            const QJsonObject body = QJsonDocument::fromJson(entry["body"].toString().toUtf8()).object();
            rows.append(entry["method"].toString() + ' ' + entry["path"].toString().section('/', -1) + ' ' +
                        body["username"].toString() + ' ' + body["password"].toString());
        }
        return rows;
    }
    /// The calls on one bus, in order.
    QStringList calls(const QString& bus)
    {
        QStringList rows;
        for (const QJsonObject& entry : m_platform.record("dbus")) {
            if (entry["bus"] == bus)
                rows.append(entry["service"].toString() + ' ' + entry["method"].toString() + ' ' +
                            entry["args"].toVariant().toStringList().join(' '));
        }
        return rows;
    }
    /// The programs that were started; sorted, since they run side by side.
    QStringList processes()
    {
        QStringList rows;
        for (const QJsonObject& entry : m_platform.record("process")) {
            rows.append(entry["name"].toString() + ' ' + entry["args"].toVariant().toStringList().join(' '));
            if (entry.contains("token_ok"))
                rows.last() += entry["token_ok"].toBool() ? " accepted" : " rejected";
        }
        rows.sort();
        return rows;
    }
    bool isQuit() { return requests().filter("POST remove " + kUser).size() == 1; }
    /// Neither what was logged nor what was written holds the text.
    void verifyKeptSecret(const QString& text)
    {
        QCOMPARE(m_log->lines().filter(text), QStringList());
        QVERIFY(!testfiles::read("/run/room/syslog").contains(text.toUtf8()));
        for (const char* directory : {"/tmp/zent", "/etc/zent"}) {
            QDirIterator files(directory, QDir::Files | QDir::Hidden, QDirIterator::Subdirectories);
            while (files.hasNext()) {
                const QString path = files.next();
                QVERIFY2(!testfiles::read(path).contains(text.toUtf8()), qPrintable(path));
            }
        }
    }

private slots:
    void initTestCase()
    {
        m_path = qgetenv("PATH");
        m_boxTimer.setInterval(5);
        connect(&m_boxTimer, &QTimer::timeout, this, &TestRelease::closeBox);
        m_boxTimer.start();
        testfiles::write(zent::kBackupConfigPath, "[config]\nControlCenterList=accounts, network\n");
    }

    void init()
    {
        m_platform.clearFaults();
        m_platform.patchState({{"services", QJsonObject{{"zentg", true}, {"iam", true}, {"login1", true}}},
                               {"iam", QJsonObject{{"enable", true}, {"read_only", false}}}});
        terminalsettings::manage();
        testfiles::remove("/tmp/zent");
        m_boxes.clear();
        m_log = std::make_unique<LogCapture>();
        m_dialog = std::make_unique<closeGuarddialog>();
        m_dialog->setUsrname(kUser);
        m_dialog->setScencelist(3);
        m_platform.clearRecord();
    }

    void cleanup()
    {
        qputenv("PATH", m_path);
        m_dialog.reset();
        m_log.reset();
    }

    void refusedPasswordChangesNothing_data()
    {
        const QString refused = QStringLiteral("管理员帐号或密码错误");
        addColumns<QJsonObject, QString, QString>("fault", "box", "logged");
        addRow("wrong password", QJsonObject(), QStringLiteral("管理员账号或密码错误"), refused);
        addRow("500 with a good body", answer(0, true, 500), kNetworkText, kNetworkText);
        addRow("no answer", QJsonObject{{"drop", "before"}}, kNetworkText, kNetworkText);
        addRow("result false", answer(0, false), kSaid, refused);
        addRow("result not a boolean", answer(0, "true"), kSaid, refused);
        addRow("no data", answer(0, QJsonValue::Undefined), kSaid, refused);
        addRow("code 1 with result true", answer(1, true), kSaid, refused);
        addRow("not JSON", QJsonObject{{"body", "<html>"}}, "", "");
    }
    void refusedPasswordChangesNothing()
    {
        QFETCH(QJsonObject, fault);
        QFETCH(QString, box);
        QFETCH(QString, logged);
        const QString typed = fault.isEmpty() ? "No-such@pass" : kAdministratorPassword;
        if (!fault.isEmpty())
            m_platform.addFault({{"path", "*/remove_status"}}, fault);
        attempt(typed);
        QTRY_COMPARE(m_boxes, QStringList({box}));
        QTRY_COMPARE(password()->text(), box.isEmpty() ? typed : QString());
        QVERIFY(m_log->contains(logged));
        QVERIFY(m_dialog->isVisible());
        QVERIFY(!spinner()->isVisible());
        QCOMPARE(terminalsettings::all(), terminalsettings::kManaged);
        QVERIFY(!QFile::exists(zent::kTmpUserinfoPath));
        QCOMPARE(calls("system") + calls("session") + processes(), QStringList());
        verifyKeptSecret(typed);
        m_dialog->findChild<QPushButton*>("close")->click();
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(password()->text(), QString());
    }

    void acceptedPasswordReleasesTheTerminal()
    {
        QVERIFY(!password()->isEchoButtonVisible());
        attempt(kAdministratorPassword);
        QTRY_VERIFY(shown<QLabel>(QStringLiteral("解除中,请稍后...")));
        QVERIFY(!spinnerButton(QStringLiteral("确定"))->isEnabled());
        QCOMPARE(password()->text(), QString());
        QVERIFY(!spinner()->close());
        QTest::keyClick(spinner(), Qt::Key_Escape);
        QVERIFY(spinner()->isVisible());
        QVERIFY(!promptShown());
        QTRY_VERIFY(promptShown());
        QVERIFY(!spinnerButton(QStringLiteral("确定")));
        QTRY_VERIFY(isQuit());
        QTRY_COMPARE(processes().size(), 5);
        QTRY_COMPARE(terminalsettings::all(), terminalsettings::kReleased);
        spinnerButton(QStringLiteral("立即重启"))->click();

        QCOMPARE(requests(),
                 QStringList({"POST remove_status zhangsan " + kAdministratorPassword, "POST remove zhangsan "}));
        QCOMPARE(calls("system"), QStringList({"com.vantor.zent.zentg onDomainConfig remove",
                                               "com.vantor.zent.iam Set com.vantor.zent.iam Enable false",
                                               "org.freedesktop.login1 Reboot true"}));
        QCOMPARE(calls("session"), QStringList({"com.vantor.daemon.Network GetActiveConnectionInfo "}));
        QCOMPARE(processes(), QStringList({"fenx-cli.bash --cmd thirdscript --thirdscript " + kDirectoryScript +
                                               " --args " + zent::thirdScriptToken(kDirectoryScript) + " accepted",
                                           "systemctl --global disable tarn", "systemctl --global disable zents",
                                           "systemctl --global stop tarn", "systemctl --global stop zents"}));
        const QJsonObject info = QJsonDocument::fromJson(testfiles::read(zent::kTmpUserinfoPath)).object();
        QCOMPARE(info.value("is_Domain"), QJsonValue(false));
        QCOMPARE(m_boxes, QStringList());
        QVERIFY(m_log->contains(QStringLiteral("本地退域完成... ")));
        verifyKeptSecret(kAdministratorPassword);
    }

    void failingStepStillEndsInThePrompt_data()
    {
        addColumns<QJsonObject, QString, QJsonObject, QString>("state", "method", "fault", "box");
        const QString leave = QStringLiteral("退域执行失败!");
        const QString disable = QStringLiteral("退域执行失败");
        const QJsonObject none;
        const auto away = [](const char* service) { return QJsonObject{{"services", QJsonObject{{service, false}}}}; };
        const QJsonObject faults[] = {{{"error", "com.vantor.Error.Busy"}}, {{"vanish", true}}};
        for (const QJsonObject& fault : faults) {
            const QByteArray kind = fault.keys().value(0).toUtf8();
            addRow("agent: " + kind, none, "onDomainConfig", fault, leave);
            addRow("identity service: " + kind, none, "Set", fault, disable);
        }
        addRow("agent's answer is overdue", none, "onDomainConfig",
               QJsonObject{{"error", "org.freedesktop.DBus.Error.NoReply"}}, leave);
        addRow("agent answers nothing", none, "onDomainConfig", QJsonObject{{"no_value", true}}, leave);
        addRow("agent answers a text", none, "onDomainConfig", QJsonObject{{"value", "0"}, {"signature", "s"}}, leave);
        addRow("no agent", away("zentg"), "", none, leave);
        addRow("identity service hangs until it ends", none, "Set", QJsonObject{{"vanish", true}, {"delay_ms", 500}},
               disable);
        addRow("Enable is read-only", QJsonObject{{"iam", QJsonObject{{"read_only", true}}}}, "", none, disable);
        addRow("no identity service", away("iam"), "", none, disable);
        addRow("no program can be started", none, "", none, "");
    }

    void failingStepStillEndsInThePrompt()
    {
        QFETCH(QJsonObject, state);
        QFETCH(QString, method);
        QFETCH(QJsonObject, fault);
        QFETCH(QString, box);
        const bool programs = !box.isEmpty();
        if (!state.isEmpty())
            m_platform.patchState(state);
        if (!fault.isEmpty())
            m_platform.addFault({{"dbus", method}}, fault);
        if (!programs)
            qputenv("PATH", "/nonexistent");
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinner()->isVisible());
        QTRY_VERIFY(promptShown());
        QTRY_COMPARE(m_boxes, programs ? QStringList{box} : QStringList());
        qputenv("PATH", m_path);
        QTRY_COMPARE(isQuit(), !programs);
        QTRY_COMPARE(processes().size(), programs ? 5 : 0);
        QVERIFY(m_log->contains(box.isEmpty() || box.endsWith('!') ? box : QStringLiteral("Enable false 失败")));
        spinnerButton(QStringLiteral("稍后重启"))->click();
        QVERIFY(!spinner()->isVisible());
    }

    void refusedRebootCanBeTriedAgain_data()
    {
        addColumns<QJsonObject, bool>("fault", "refused");
        addRow("error", QJsonObject{{"error", "org.freedesktop.DBus.Error.AccessDenied"}}, true);
        addRow("vanishes", QJsonObject{{"vanish", true}}, true);
        addRow("hangs until it ends", QJsonObject{{"vanish", true}, {"delay_ms", 500}}, true);
        addRow("absent", QJsonObject(), true);
        addRow("odd answer", QJsonObject{{"value", 7}, {"signature", "i"}}, false);
    }
    void refusedRebootCanBeTriedAgain()
    {
        QFETCH(QJsonObject, fault);
        QFETCH(bool, refused);
        if (fault.isEmpty())
            m_platform.patchState({{"services", QJsonObject{{"login1", false}}}});
        m_platform.addFault({{"dbus", "Reboot"}}, fault);
        spinner()->show();
        spinner()->onRemoveController();
        QTRY_VERIFY(promptShown());
        for (const int lines : {refused ? 2 : 1, 1}) {
            const LogCapture log;
            spinnerButton(QStringLiteral("立即重启"))->click();
            QCOMPARE(log.count("reboot"), lines);
            QVERIFY(promptShown());
            m_platform.clearFaults();
            m_platform.patchState({{"services", QJsonObject{{"login1", true}}}});
        }
    }

    void hungAgentFreezesNothing()
    {
        m_dialog.reset();
        m_platform.addFault({{"dbus", "*"}, {"service", "com.vantor.zent.zentg"}}, {{"hang", true}});
        QElapsedTimer timer;
        timer.start();
        m_dialog = std::make_unique<closeGuarddialog>();
        m_dialog->setUsrname(kUser);
        m_dialog->show();
        QVERIFY2(timer.elapsed() < 5000, "waits for the agent");
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinner()->isVisible());
        QTRY_VERIFY(promptShown());
        QCOMPARE(calls("system"), QStringList({"com.vantor.zent.zentg onDomainConfig remove"}));
        QVERIFY(!isQuit());
        QCOMPARE(m_boxes, QStringList());
    }

    void dialogIsReused()
    {
        attempt("wrong");
        QTRY_COMPARE(m_boxes.size(), 1);
        QTRY_COMPARE(password()->text(), QString());
        for (int round = 1; round <= 2; ++round) {
            attempt(kAdministratorPassword);
            QTRY_VERIFY(shown<QLabel>(QStringLiteral("解除中,请稍后...")));
            QVERIFY(!spinnerButton(QStringLiteral("稍后重启")));
            QVERIFY(spinnerButton(QStringLiteral("确定")));
            QVERIFY(!spinner()->close());
            QTRY_VERIFY(promptShown());
            QTRY_COMPARE(requests().filter("POST remove zhangsan").size(), round);
            QTRY_COMPARE(processes().size(), 5 * round);
            QSignalSpy closed(spinner(), &spinerWin::closeFatherwin);
            spinnerButton(QStringLiteral("稍后重启"))->click();
            QVERIFY(!closed.isEmpty());
            QVERIFY(!spinner()->isVisible());
        }
        QCOMPARE(calls("system").filter("Reboot"), QStringList());
    }

    void escapeForgetsAndTheMachineMayBeUnknown()
    {
        testfiles::remove(zent::kMachineidPath);
        m_dialog = std::make_unique<closeGuarddialog>();
        m_dialog->show();
        QTest::keyClicks(password(), kAdministratorPassword);
        QTest::keyClick(password(), Qt::Key_Escape);
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(password()->text(), QString());
    }

    void windowKeepsOneDialog()
    {
        MainWindow window(nullptr, 1020);
        window.onCloseguardClicked();
        window.onCloseguardClicked();
        const QList<closeGuarddialog*> dialogs = window.findChildren<closeGuarddialog*>();
        QCOMPARE(dialogs.size(), 1);
        QVERIFY(dialogs.first()->isVisible());
        // Each click has connected it once more.
        window.show();
        LogCapture log;
        dialogs.first()->closeallfather();
        QVERIFY(!window.isVisible());
        QCOMPARE(log.count("closeEvent"), 2);
    }
};

QTEST_MAIN(TestRelease)
#include "test_release.moc"

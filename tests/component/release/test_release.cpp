#include "boxcloser.h"
#include "closeguarddialog.h"
#include "logcapture.h"
#include "paths.h"
#include "platformcontrol.h"
#include "spinerwin.h"
#include "testfiles.h"
#include "testrows.h"
#include "thirdscript.h"
#include "toolkitpasswordedit.h"

#include <QElapsedTimer>
#include <QProcess>
#include <QPushButton>

namespace
{

const QString kAdministratorPassword = QStringLiteral("Admin@2026");
const QString kOk = QStringLiteral("确定");
const QString kNow = QStringLiteral("立即重启");
const QString kLater = QStringLiteral("稍后重启");
const QString kNetworkText = QStringLiteral("网络异常，请稍后重试");
const QString kSaid = QStringLiteral("服务器说明");
const QString kDirectoryScript = QStringLiteral("/usr/share/lumo/restore_ldap.bash");
/// A reply of the server with that result.
QJsonObject answer(int code, const QJsonValue& result, int status = 200)
{
    const QJsonObject reply{{"code", code}, {"msg", kSaid}, {"data", QJsonObject{{"result", result}}}};
    return {{"status", status}, {"body", QString::fromUtf8(QJsonDocument(reply).toJson())}};
}

/// Sets everything that a release changes to what it is not afterwards.
const char* const kManage = R"(set -e
set_lock="gsettings set com.vantor.zent.lockdown"
for key in $(gsettings list-keys com.vantor.zent.lockdown | grep "able$" | grep -v hotspot); do
    $set_lock $key false
done
$set_lock hotspot-enable 0
$set_lock control-center-hidden '["accounts"]'
set_center="gsettings set com.vantor.oxa.control-center"
$set_center auto-login-visable true
$set_center nopasswd-login-visable true
$set_center hide-module '["accounts"]')";

const QStringList kReleased{"auto-login-visable false",
                            "hide-module @as []",
                            "nopasswd-login-visable false",
                            " 1 1",
                            " 1 ['']",
                            " 1 ['accounts', 'network']",
                            " 7 true"};

/// The output of a shell command, which reads and sets the desktop's settings with the desktop's own tool.
QStringList shell(const QString& command)
{
    QProcess program;
    program.start("/bin/sh", {"-c", command});
    if (!program.waitForFinished() || program.exitCode() != 0)
        qFatal("%s: %s", qPrintable(command), program.readAllStandardError().constData());
    return QString::fromUtf8(program.readAllStandardOutput()).split('\n', Qt::SkipEmptyParts);
}

/// The control center's keys and values, and how many of the lock-down's keys have which value.
QStringList settings()
{
    return shell("export LC_ALL=C; gsettings list-recursively com.vantor.oxa.control-center | cut -d' ' -f2- | sort; "
                 "gsettings list-recursively com.vantor.zent.lockdown | cut -d' ' -f3- | sort | uniq -c | tr -s ' '");
}

} // namespace

class TestRelease : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    BoxCloser m_boxes;
    QStringList m_managed;
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<closeGuarddialog> m_dialog;

    ToolkitPasswordEdit* password() const { return m_dialog->findChild<ToolkitPasswordEdit*>("password"); }
    spinerWin* spinner() const { return m_dialog->findChild<spinerWin*>(); }
    /// The visible button of the spinner window with that text.
    QPushButton* button(const QString& text) const
    {
        for (QPushButton* candidate : spinner()->findChildren<QPushButton*>()) {
            if (candidate->text() == text && candidate->isVisible())
                return candidate;
        }
        return nullptr;
    }
    void makeDialog()
    {
        m_dialog = std::make_unique<closeGuarddialog>();
        m_dialog->setUsrname("zhangsan");
    }
    void attempt(const QString& typed)
    {
        m_dialog->show();
        password()->setText(typed);
        QTest::keyClick(password(), Qt::Key_Return);
    }
    /// What was recorded of one kind, in order.
    QStringList record(const QString& kind)
    {
        QStringList rows;
        for (const QJsonObject& entry : m_platform.record(kind)) {
            const QJsonObject body = QJsonDocument::fromJson(entry["body"].toString().toUtf8()).object();
            const QString args = entry["args"].toVariant().toStringList().join(' ');
            if (kind == "http")
                rows.append(entry["path"].toString().section('/', -1) + ' ' + body["username"].toString() + ' ' +
                            body["password"].toString());
            else if (kind == "process")
                rows.append(entry["name"].toString() + ' ' + args + (entry["token_ok"].toBool() ? " accepted" : ""));
            else if (entry["bus"] == "system")
                rows.append(entry["service"].toString() + ' ' + entry["method"].toString() + ' ' + args);
        }
        return rows;
    }
    int quits() { return record("http").count("remove zhangsan "); }
    /// Neither what was logged nor what was written holds the text.
    void verifyKeptSecret(const QString& text)
    {
        QCOMPARE(m_log->lines().filter(text), QStringList());
        for (const QString& path : {zent::kUserinfoPath, zent::kTmpUserinfoPath})
            QVERIFY2(!testfiles::read(path).contains(text.toUtf8()), qPrintable(path));
    }

private slots:
    void initTestCase()
    {
        testfiles::write(zent::kBackupConfigPath, "[config]\nControlCenterList=accounts, network\n");
    }

    void init()
    {
        m_platform.clearFaults();
        m_platform.patchState({{"services", QJsonObject{{"zentg", true}, {"iam", true}, {"login1", true}}},
                               {"iam", QJsonObject{{"enable", true}, {"read_only", false}}}});
        shell(kManage);
        m_managed = settings();
        testfiles::remove("/tmp/zent");
        m_boxes.texts.clear();
        m_log = std::make_unique<LogCapture>();
        makeDialog();
        m_platform.clearRecord();
    }

    void cleanup()
    {
        m_dialog.reset();
        m_log.reset();
    }

    void refusedPasswordChangesNothing_data()
    {
        addColumns<QJsonObject, QString>("fault", "box");
        addRow("wrong password", QJsonObject(), QStringLiteral("管理员账号或密码错误"));
        addRow("500 with a good body", answer(0, true, 500), kNetworkText);
        addRow("result not a boolean", answer(0, "true"), kSaid);
        addRow("code 1 with result true", answer(1, true), kSaid);
        addRow("not JSON", QJsonObject{{"body", "<html>"}}, "");
    }
    void refusedPasswordChangesNothing()
    {
        QFETCH(QJsonObject, fault);
        QFETCH(QString, box);
        const QString typed = fault.isEmpty() ? "No-such@pass" : kAdministratorPassword;
        if (!fault.isEmpty())
            m_platform.addFault({{"path", "*/remove_status"}}, fault);
        attempt(typed);
        QTRY_COMPARE(m_boxes.texts, QStringList({box}));
        QTRY_COMPARE(password()->text(), box.isEmpty() ? typed : QString());
        QVERIFY(m_dialog->isVisible() && !spinner()->isVisible());
        QCOMPARE(settings(), m_managed);
        QVERIFY(!QFile::exists(zent::kTmpUserinfoPath));
        QCOMPARE(record("dbus") + record("process"), QStringList());
        verifyKeptSecret(typed);
        QTest::keyClick(password(), Qt::Key_Escape);
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(password()->text(), QString());
    }

    void acceptedPasswordReleasesTheTerminal()
    {
        attempt(kAdministratorPassword);
        QTRY_VERIFY(button(kOk));
        QVERIFY(!button(kOk)->isEnabled() && !button(kNow));
        QCOMPARE(password()->text(), QString());
        QTest::keyClick(spinner(), Qt::Key_Escape);
        QVERIFY(spinner()->isVisible());
        QTRY_VERIFY(button(kNow) && !button(kOk));
        QTRY_COMPARE(quits(), 1);
        QTRY_COMPARE(record("process").size(), 5);
        QTRY_COMPARE(settings(), kReleased);
        button(kNow)->click();

        QCOMPARE(record("http"), QStringList({"remove_status zhangsan " + kAdministratorPassword, "remove zhangsan "}));
        QCOMPARE(record("dbus"), QStringList({"com.vantor.zent.zentg onDomainConfig remove",
                                              "com.vantor.zent.iam Set com.vantor.zent.iam Enable false",
                                              "org.freedesktop.login1 Reboot true"}));
        QStringList processes = record("process");
        processes.sort();
        QCOMPARE(processes, QStringList({"fenx-cli.bash --cmd thirdscript --thirdscript " + kDirectoryScript +
                                             " --args " + zent::thirdScriptToken(kDirectoryScript) + " accepted",
                                         "systemctl --global disable tarn", "systemctl --global disable zents",
                                         "systemctl --global stop tarn", "systemctl --global stop zents"}));
        const QJsonObject info = QJsonDocument::fromJson(testfiles::read(zent::kTmpUserinfoPath)).object();
        QCOMPARE(info.value("is_Domain"), QJsonValue(false));
        QCOMPARE(m_boxes.texts, QStringList());
        verifyKeptSecret(kAdministratorPassword);

        // The same dialog serves again.
        button(kLater)->click();
        QVERIFY(!spinner()->isVisible());
        attempt(kAdministratorPassword);
        QTRY_VERIFY(button(kOk) && !button(kLater));
        QTRY_VERIFY(button(kLater));
        QTRY_COMPARE(quits(), 2);
        QTRY_COMPARE(record("process").size(), 10);
    }

    void failingStepStillEndsInThePrompt_data()
    {
        addColumns<QJsonObject, QString, QJsonObject, QString>("state", "method", "fault", "box");
        const QString leave = QStringLiteral("退域执行失败!");
        const QString disable = QStringLiteral("退域执行失败");
        const QJsonObject none;
        const QJsonObject error{{"error", "com.vantor.Error.Busy"}};
        const QJsonObject text{{"value", "0"}, {"signature", "s"}};
        const QJsonObject hangs{{"vanish", true}, {"delay_ms", 500}};
        addRow("agent fails", none, "onDomainConfig", error, leave);
        addRow("agent answers a text", none, "onDomainConfig", text, leave);
        addRow("no agent", QJsonObject{{"services", QJsonObject{{"zentg", false}}}}, "", none, leave);
        addRow("identity service hangs until it ends", none, "Set", hangs, disable);
        addRow("Enable is read-only", QJsonObject{{"iam", QJsonObject{{"read_only", true}}}}, "", none, disable);
    }
    void failingStepStillEndsInThePrompt()
    {
        QFETCH(QJsonObject, state);
        QFETCH(QString, method);
        QFETCH(QJsonObject, fault);
        QFETCH(QString, box);
        if (!state.isEmpty())
            m_platform.patchState(state);
        if (!fault.isEmpty())
            m_platform.addFault({{"dbus", method}}, fault);
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinner()->isVisible());
        QTRY_VERIFY(button(kNow));
        QTRY_COMPARE(m_boxes.texts, QStringList{box});
        QCOMPARE(quits(), 0);
        QTRY_COMPARE(record("process").size(), 5);
    }

    void refusedRebootCanBeTriedAgain()
    {
        m_platform.addFault({{"dbus", "Reboot"}}, {{"vanish", true}, {"delay_ms", 500}});
        spinner()->show();
        spinner()->onRemoveController();
        QTRY_VERIFY(button(kNow));
        // A line for the try and one for what it met.
        for (const int lines : {2, 1}) {
            const LogCapture log;
            button(kNow)->click();
            QCOMPARE(log.count("reboot"), lines);
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
        makeDialog();
        m_dialog->show();
        QVERIFY2(timer.elapsed() < 5000, "waits for the agent");
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinner()->isVisible());
        QTRY_VERIFY(button(kNow));
        QCOMPARE(record("dbus"), QStringList({"com.vantor.zent.zentg onDomainConfig remove"}));
        QCOMPARE(quits(), 0);
        QCOMPARE(m_boxes.texts, QStringList());
    }
};

QTEST_MAIN(TestRelease)
#include "test_release.moc"

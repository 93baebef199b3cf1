#include "closeguarddialog.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "paths.h"
#include "platformcontrol.h"
#include "spinerwin.h"
#include "terminalsettings.h"
#include "testfiles.h"
#include "toolkitpasswordedit.h"

#include <QApplication>
#include <QDirIterator>
#include <QElapsedTimer>
#include <QLabel>
#include <QPushButton>
#include <QtTest>

namespace
{

const QString kUser = QStringLiteral("zhangsan");
const QString kAdministratorPassword = QStringLiteral("Admin@2026");
const QString kPromptText = QStringLiteral("当前终端已解除管控,重启后生效");
const QString kNetworkText = QStringLiteral("网络异常，请稍后重试");
const QString kDirectoryScript = QStringLiteral("/usr/share/lumo/restore_ldap.bash");

/// The front end's token as shell tools make it.
QString tokenOf(const QString& script)
{
    return terminalsettings::shell("first=$(printf %s \"kobaltrix_20191104$1pemb_20191104\" | sha256sum | cut -c1-64); "
                                   "printf %s \"$first\" | sha256sum | cut -c1-64",
                                   {script});
}

QByteArray answer(const QJsonValue& code, const QJsonObject& rest)
{
    QJsonObject reply = rest;
    reply.insert("code", code);
    reply.insert("msg", QStringLiteral("服务器说明"));
    return QJsonDocument(reply).toJson();
}

QJsonObject bodyFault(const QByteArray& body)
{
    return {{"body", QString::fromUtf8(body)}};
}

QStringList words(const QJsonArray& values)
{
    QStringList result;
    for (const QJsonValue& value : values)
        result.append(value.isBool() ? QString(value.toBool() ? "true" : "false") : value.toVariant().toString());
    return result;
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
    QPushButton* spinnerButton(const QString& text) const
    {
        for (QPushButton* button : spinner()->findChildren<QPushButton*>()) {
            if (button->text() == text && button->isVisible())
                return button;
        }
        return nullptr;
    }
    bool spinnerSays(const QString& text) const
    {
        for (const QLabel* label : spinner()->findChildren<QLabel*>()) {
            if (label->text() == text && label->isVisible())
                return true;
        }
        return false;
    }
    bool promptShown() const { return spinnerSays(kPromptText) && spinnerButton(QStringLiteral("立即重启")); }
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
                            words(entry["args"].toArray()).join(' '));
        }
        return rows;
    }
    /// The programs that were started; sorted, since they run side by side.
    QStringList processes()
    {
        QStringList rows;
        for (const QJsonObject& entry : m_platform.record("process")) {
            rows.append(entry["name"].toString() + ' ' + words(entry["args"].toArray()).join(' '));
            if (entry.contains("token_ok"))
                rows.last() += entry["token_ok"].toBool() ? " accepted" : " rejected";
        }
        rows.sort();
        return rows;
    }
    bool isQuit() { return requests().filter("POST remove " + kUser).size() == 1; }
    void verifyUntouched()
    {
        QCOMPARE(terminalsettings::all(), terminalsettings::kManaged);
        QVERIFY(!QFile::exists(zent::kTmpUserinfoPath));
        QCOMPARE(calls("system") + calls("session") + processes(), QStringList());
        QVERIFY(!spinner()->isVisible());
    }
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
        const QString said = QStringLiteral("服务器说明");
        const QString refused = QStringLiteral("管理员帐号或密码错误");
        const QJsonObject accepted{{"data", QJsonObject{{"result", true}}}};
        QTest::addColumn<QJsonObject>("fault");
        QTest::addColumn<QString>("box");
        QTest::addColumn<QString>("logged");
        QTest::addColumn<bool>("kept");
        QTest::newRow("wrong password") << QJsonObject() << QStringLiteral("管理员账号或密码错误") << refused << false;
        QTest::newRow("500 with a good body")
            << QJsonObject{{"status", 500}, {"body", QString::fromUtf8(answer(0, accepted))}} << kNetworkText
            << kNetworkText << false;
        QTest::newRow("no answer") << QJsonObject{{"drop", "before"}} << kNetworkText << kNetworkText << false;
        QTest::newRow("result false") << bodyFault(answer(0, {{"data", QJsonObject{{"result", false}}}})) << said
                                      << refused << false;
        QTest::newRow("result not a boolean")
            << bodyFault(answer(0, {{"data", QJsonObject{{"result", "true"}}}})) << said << refused << false;
        QTest::newRow("no data") << bodyFault(answer(0, {})) << said << refused << false;
        QTest::newRow("code 1 with result true") << bodyFault(answer(1, accepted)) << said << refused << false;
        QTest::newRow("not JSON") << bodyFault("<html>") << QString() << QString() << true;
    }

    void refusedPasswordChangesNothing()
    {
        QFETCH(QJsonObject, fault);
        QFETCH(QString, box);
        QFETCH(QString, logged);
        QFETCH(bool, kept);
        const QString typed = fault.isEmpty() ? "No-such@pass" : kAdministratorPassword;
        if (!fault.isEmpty())
            m_platform.addFault({{"path", "*/remove_status"}}, fault);
        attempt(typed);
        QTRY_COMPARE(m_boxes, QStringList({box}));
        QTRY_COMPARE(password()->text(), kept ? typed : QString());
        QVERIFY(m_log->contains(logged));
        QVERIFY(m_dialog->isVisible());
        verifyUntouched();
        verifyKeptSecret(typed);
        m_dialog->findChild<QPushButton*>("close")->click();
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(password()->text(), QString());
    }

    void acceptedPasswordReleasesTheTerminal()
    {
        QVERIFY(!password()->isEchoButtonVisible());
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinnerSays(QStringLiteral("解除中,请稍后...")));
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
                                               " --args " + tokenOf(kDirectoryScript) + " accepted",
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
        const QString leave = QStringLiteral("退域执行失败!");
        QTest::addColumn<QJsonObject>("state");
        QTest::addColumn<QJsonObject>("fault");
        QTest::addColumn<QStringList>("boxes");
        QTest::addColumn<bool>("programs");
        QTest::newRow("agent answers an error")
            << QJsonObject() << QJsonObject{{"error", "com.vantor.Error.Busy"}} << QStringList({leave}) << true;
        QTest::newRow("agent's answer is overdue")
            << QJsonObject() << QJsonObject{{"error", "org.freedesktop.DBus.Error.NoReply"}} << QStringList({leave})
            << true;
        QTest::newRow("agent ends during the call")
            << QJsonObject() << QJsonObject{{"vanish", true}} << QStringList({leave}) << true;
        QTest::newRow("no agent") << QJsonObject{{"services", QJsonObject{{"zentg", false}}}} << QJsonObject()
                                  << QStringList({leave}) << true;
        QTest::newRow("Enable is read-only") << QJsonObject{{"iam", QJsonObject{{"read_only", true}}}} << QJsonObject()
                                             << QStringList({QStringLiteral("退域执行失败")}) << true;
        QTest::newRow("no identity service") << QJsonObject{{"services", QJsonObject{{"iam", false}}}} << QJsonObject()
                                             << QStringList({QStringLiteral("退域执行失败")}) << true;
        QTest::newRow("no program can be started") << QJsonObject() << QJsonObject() << QStringList() << false;
    }

    void failingStepStillEndsInThePrompt()
    {
        QFETCH(QJsonObject, state);
        QFETCH(QJsonObject, fault);
        QFETCH(QStringList, boxes);
        QFETCH(bool, programs);
        if (!state.isEmpty())
            m_platform.patchState(state);
        if (!fault.isEmpty())
            m_platform.addFault({{"dbus", "onDomainConfig"}}, fault);
        if (!programs)
            qputenv("PATH", "/nonexistent");
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinner()->isVisible());
        QTRY_VERIFY(promptShown());
        QTRY_COMPARE(m_boxes, boxes);
        qputenv("PATH", m_path);
        if (boxes.isEmpty())
            QTRY_VERIFY(isQuit());
        QCOMPARE(isQuit(), boxes.isEmpty());
        QTRY_COMPARE(processes().size(), programs ? 5 : 0);
        for (const QString& text : boxes)
            QVERIFY(m_log->contains(text.endsWith('!') ? text : QStringLiteral("设置统一认证Enable false 失败")));
        spinnerButton(QStringLiteral("稍后重启"))->click();
        QVERIFY(!spinner()->isVisible());
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
            QTRY_VERIFY(spinnerSays(QStringLiteral("解除中,请稍后...")));
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

    void escapeClosesAndForgets()
    {
        testfiles::remove(zent::kMachineidPath);
        m_dialog = std::make_unique<closeGuarddialog>();
        QVERIFY(m_log->contains("no machine.txt to use"));
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

        struct CloseCounter : QObject {
            int count = 0;
            bool eventFilter(QObject*, QEvent* event) override
            {
                count += event->type() == QEvent::Close ? 1 : 0;
                return false;
            }
        } counter;
        window.show();
        window.installEventFilter(&counter);
        dialogs.first()->closeallfather();
        QVERIFY(!window.isVisible());
        QCOMPARE(counter.count, 2);
    }
};

QTEST_MAIN(TestRelease)
#include "test_release.moc"

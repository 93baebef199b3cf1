// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "closeguarddialog.h"
#include "desktopsettings.h"
#include "fixture.h"
#include "platformcontrol.h"
#include "spinerwin.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"

#include <QElapsedTimer>
#include <QLabel>
#include <QPushButton>
#include <QScreen>
#include <QSignalSpy>

namespace
{

const QString kAdministratorPassword = QStringLiteral("Admin@2026");
const QString kOk = QStringLiteral("确定");
const QString kNow = QStringLiteral("立即重启");
const QString kLater = QStringLiteral("稍后重启");

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
        for (const QString& path : {testfiles::kInfoFile, testfiles::kStagedInfoFile})
            QVERIFY2(!testfiles::read(path).contains(text.toUtf8()), qPrintable(path));
    }

private slots:
    void initTestCase() { testfiles::write(testfiles::kBackupFile, "[config]\nControlCenterList=accounts, network\n"); }

    void init()
    {
        m_platform.clearFaults();
        m_platform.patchState({{"services", QJsonObject{{"zentg", true}, {"iam", true}, {"login1", true}}},
                               {"iam", QJsonObject{{"enable", true}, {"read_only", false}}}});
        desktopsettings::manage();
        m_managed = desktopsettings::values();
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

    void spinnerTellsOfItsEnd()
    {
        QSignalSpy ended(spinner(), &spinerWin::uploadcloseguard);
        QSignalSpy closed(spinner(), &spinerWin::closeFatherwin);
        spinner()->show();
        spinner()->close();
        QVERIFY(spinner()->isVisible());
        QCOMPARE(closed.size() + ended.size(), 0);
        spinner()->onRemoveController();
        QCOMPARE(ended.size(), 1);
        QCOMPARE(closed.size(), 0);
        // Once for the click, once for the window that closes.
        QTRY_VERIFY(button(kLater));
        button(kLater)->click();
        QVERIFY(!spinner()->isVisible());
        QCOMPARE(closed.size(), 2);
        spinner()->show();
        spinner()->close();
        QCOMPARE(closed.size(), 3);
        QCOMPARE(ended.size(), 1);
    }

    void dialogTellsItsFatherToClose()
    {
        QSignalSpy closed(m_dialog.get(), &closeGuarddialog::closeall);
        m_dialog->closeallfather();
        QCOMPARE(closed.size(), 1);
        m_dialog->show();
        m_dialog->findChild<QPushButton*>("close")->click();
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(m_dialog->result(), static_cast<int>(QDialog::Accepted));
        QCOMPARE(closed.size(), 1);
    }

    void refusedPasswordChangesNothing_data() { fixture::addRows("releaserefusals.json"); }
    void refusedPasswordChangesNothing()
    {
        QFETCH(QJsonObject, row);
        const QString typed = row["typed"].toString();
        if (row.contains("reply"))
            m_platform.addFault({{"path", "*/remove_status"}}, row["reply"].toObject());
        attempt(typed);
        QTRY_COMPARE(m_boxes.texts, QStringList({row["box"].toString()}));
        QTRY_COMPARE(password()->text(), row["kept"].toString());
        QVERIFY(m_dialog->isVisible() && !spinner()->isVisible());
        QCOMPARE(desktopsettings::values(), m_managed);
        QVERIFY(!QFile::exists(testfiles::kStagedInfoFile));
        QCOMPARE(record("dbus") + record("process"), QStringList());
        verifyKeptSecret(typed);
        QTest::keyClick(password(), Qt::Key_Escape);
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(password()->text(), QString());
    }

    void acceptedPasswordReleasesTheTerminal()
    {
        const auto* circle = spinner()->findChild<ToolkitSpinner*>();
        spinner()->move(1, 1);
        attempt(kAdministratorPassword);
        QTRY_VERIFY(button(kOk));
        QVERIFY(!button(kOk)->isEnabled() && !button(kNow) && circle->isVisible());
        const QPoint offset = spinner()->geometry().center() - spinner()->screen()->geometry().center();
        QVERIFY2(offset.manhattanLength() <= 2, qPrintable(QString("%1 %2").arg(offset.x()).arg(offset.y())));
        QCOMPARE(password()->text(), QString());
        QTest::keyClick(spinner(), Qt::Key_Escape);
        QVERIFY(spinner()->isVisible());
        QTRY_VERIFY(button(kNow) && !button(kOk) && !circle->isVisible());
        QTRY_COMPARE(quits(), 1);
        QTRY_COMPARE(record("process").size(), 5);
        const QJsonObject expected = fixture::read("release.json");
        QTRY_COMPARE(desktopsettings::values(), expected["settings"].toVariant().toStringList());
        button(kNow)->click();
        for (const char* kind : {"http", "dbus"})
            fixture::compare(QJsonArray::fromStringList(record(kind)), expected[kind]);
        QStringList processes = record("process");
        processes.sort();
        fixture::compare(QJsonArray::fromStringList(processes), expected["process"]);
        fixture::findInLog(*m_log, expected["log"]);
        const QJsonObject info = QJsonDocument::fromJson(testfiles::read(testfiles::kStagedInfoFile)).object();
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

    void failingStepStillEndsInThePrompt_data() { fixture::addRows("releasefailures.json"); }
    void failingStepStillEndsInThePrompt()
    {
        QFETCH(QJsonObject, row);
        if (row.contains("state"))
            m_platform.patchState(row["state"].toObject());
        if (row.contains("fault"))
            m_platform.addFault(row["match"].toObject(), row["fault"].toObject());
        QElapsedTimer timer;
        timer.start();
        makeDialog();
        m_dialog->show();
        QVERIFY2(timer.elapsed() < 5000, "waits for the agent");
        attempt(kAdministratorPassword);
        QTRY_VERIFY(spinner()->isVisible());
        QTRY_VERIFY(button(kNow));
        QTRY_COMPARE(QJsonValue(QJsonArray::fromStringList(m_boxes.texts)), row["boxes"]);
        QCOMPARE(quits(), 0);
        QTRY_COMPARE(record("process").size(), 5);
    }
};

QTEST_MAIN(TestRelease)
#include "test_release.moc"

// SPDX-License-Identifier: Apache-2.0
#include "closeguarddialog.h"
#include "desktopsettings.h"
#include "spinerwin.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"
#include "windowtest.h"

#include <QtWidgets>

class TestRelease : public WindowTest
{
    Q_OBJECT

    std::unique_ptr<closeGuarddialog> m_dialog;

    ToolkitPasswordEdit* password() const { return m_dialog->findChild<ToolkitPasswordEdit*>("password"); }
    spinerWin* spinner() const { return m_dialog->findChild<spinerWin*>(); }
    /// The visible buttons of the spinner window: to confirm, or when to restart.
    QList<QPushButton*> buttons() const
    {
        QList<QPushButton*> visible = spinner()->findChildren<QPushButton*>();
        visible.erase(std::remove_if(visible.begin(), visible.end(), [](auto* one) { return !one->isVisible(); }),
                      visible.end());
        return visible;
    }
    bool isReleased() const { return buttons().size() == 2; }
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
    /// What was recorded of one kind.
    QStringList record(const QString& kind)
    {
        QStringList rows;
        for (const QJsonObject& entry : m_platform.record(kind)) {
            const QJsonObject body = QJsonDocument::fromJson(entry["body"].toString().toUtf8()).object();
            QStringList words{entry["path"].toString(), entry["service"].toString(), entry["method"].toString(),
                              entry["name"].toString(), body["username"].toString(), body["password"].toString()};
            words += entry["args"].toVariant().toStringList();
            if (entry["bus"] != "session")
                rows.append(words.join(' ').simplified() + (entry["token_ok"].toBool() ? " accepted" : ""));
        }
        // Processes that were started together come in any order.
        if (kind == "process")
            rows.sort();
        return rows;
    }

private slots:
    void initTestCase() { testfiles::write(testfiles::kBackupFile, "[config]\nControlCenterList=accounts, network\n"); }
    void init()
    {
        m_platform.patchState({{"services", QJsonObject{{"zentg", true}, {"iam", true}, {"login1", true}}},
                               {"iam", QJsonObject{{"enable", true}, {"read_only", false}}}});
        desktopsettings::manage();
        testfiles::remove("/tmp/zent");
        startAnew();
        makeDialog();
    }
    void cleanup() { m_dialog.reset(); }

    void attempts_data() { fixture::addRows("releases.json"); }
    void attempts()
    {
        QFETCH(QJsonObject, row);
        const QString typed = row["typed"].toString();
        const QStringList managed = desktopsettings::values();
        if (row.contains("state"))
            m_platform.patchState(row["state"].toObject());
        if (row.contains("fault"))
            m_platform.addFault(row["match"].toObject(), row["fault"].toObject());
        QElapsedTimer timer;
        timer.start();
        makeDialog();
        attempt(typed);
        QVERIFY2(timer.elapsed() < 10000, "waits for the agent");
        const bool released = row["released"].toBool();
        QTRY_COMPARE(isReleased(), released);
        QTRY_COMPARE(record("http"), row["http"].toVariant().toStringList());
        QTRY_COMPARE(record("process"), row["process"].toVariant().toStringList());
        QTRY_COMPARE(m_boxes.texts, row["boxes"].toVariant().toStringList());
        QTRY_COMPARE(record("dbus"), row["dbus"].toVariant().toStringList());
        QTRY_COMPARE(desktopsettings::values(),
                     row.contains("settings") ? row["settings"].toVariant().toStringList() : managed);
        QCOMPARE(password()->text(), row["kept"].toString());
        QCOMPARE(spinner()->isVisible(), released);
        const QByteArray staged = testfiles::read(testfiles::kStagedInfoFile);
        QVERIFY(released ? staged.contains("\"is_Domain\": false") : staged.isEmpty());
        fixture::findInLog(*m_log, row["log"]);
        QVERIFY(!m_log->contains(typed) && !(staged + testfiles::read(testfiles::kInfoFile)).contains(typed.toUtf8()));
        QTest::keyClick(password(), Qt::Key_Escape);
        QVERIFY(!m_dialog->isVisible() && password()->text().isEmpty());
    }

    void progressIsShownUntilTheRestart()
    {
        const auto* circle = spinner()->findChild<ToolkitSpinner*>();
        QSignalSpy ended(spinner(), &spinerWin::uploadcloseguard);
        QSignalSpy closed(spinner(), &spinerWin::closeFatherwin);
        for (int release = 1; release <= 2; ++release) {
            spinner()->move(1, 1);
            attempt("Admin@2026");
            QTRY_COMPARE(buttons().size(), 1);
            QVERIFY(!buttons()[0]->isEnabled() && circle->isVisible());
            const QPoint offset = spinner()->geometry().center() - spinner()->screen()->geometry().center();
            QVERIFY2(offset.manhattanLength() <= 2, qPrintable(QString("%1 %2").arg(offset.x()).arg(offset.y())));
            QTest::keyClick(spinner(), Qt::Key_Escape);
            spinner()->close();
            QVERIFY(spinner()->isVisible());
            QTRY_VERIFY(isReleased() && !circle->isVisible());
            QCOMPARE(ended.size(), release);
            QCOMPARE(closed.size(), 2 * release - 2);
            buttons()[1]->click();
            fixture::compare(record("dbus").last(), "/org/freedesktop/login1 org.freedesktop.login1 Reboot true");
            // Once for the click, once for the window that closes.
            buttons()[0]->click();
            QVERIFY(!spinner()->isVisible());
            QCOMPARE(closed.size(), 2 * release);
            QTRY_COMPARE(record("process").size(), 5 * release);
        }
        QVERIFY(m_log->records().contains("info reboot"));
        m_dialog->findChild<QPushButton*>("close")->click();
        QVERIFY(!m_dialog->isVisible());
        QCOMPARE(m_dialog->result(), static_cast<int>(QDialog::Accepted));
    }
};

QTEST_MAIN(TestRelease)
#include "test_release.moc"

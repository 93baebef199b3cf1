// SPDX-License-Identifier: Apache-2.0
#include "account.h"
#include "closeguarddialog.h"
#include "description.h"
#include "fixture.h"
#include "iconbutton.h"
#include "infowidget.h"
#include "mainwindow.h"
#include "modifydialog.h"
#include "noticedialog.h"
#include "notification.h"
#include "notify.h"
#include "resumedialog.h"
#include "sessionhost.h"
#include "spinerwin.h"

#include <QDBusConnection>

/// The names, texts and sizes of each window's widgets, read from the widgets, and what the windows log when used.
class TestWindows : public QObject
{
    Q_OBJECT

    static QWidget* make(const QString& name)
    {
        if (name.startsWith("panel")) {
            auto* panel = new InfoWidget(nullptr, name.endsWith("administrator"));
            panel->setSceneBox(name.endsWith("administrator"));
            return panel;
        }
        if (name == "main window")
            return new MainWindow(nullptr, 1020);
        if (name == "icon button")
            return new IconButton(nullptr);
        if (name == "password")
            return new ModifyDialog;
        if (name == "message")
            return new NoticeDialog("zhangsan", nullptr);
        if (name == "verification")
            return new resumeDialog;
        if (name == "release")
            return new closeGuarddialog;
        auto* progress = new spinerWin;
        if (name == "released")
            progress->onRemoveController();
        return progress;
    }

    static void useAccount()
    {
        Account account;
        qInfo() << account.getUserName() << account.isAdminUser() << account.isScenceUser();
        for (const char* text : {R"({"code": 0, "data": {"user": {"id": 7, "gecos": "A,b,c,1", "client_name": "PC"}}})",
                                 R"({"code": 0, "data": [{"name": "O"}]})", R"({"code": 1})", "{"}) {
            QByteArray body = text;
            account.analyseData(&body);
            account.analyseAreaData(&body);
        }
        account.onUserInfo(404, "{");
        account.onCompanyName(404, "{");
    }

    static void useWindow(int version)
    {
        MainWindow window(nullptr, version);
        window.onActivatedSysTrayIcon(QSystemTrayIcon::Trigger);
        qInfo() << window.windowFlags() << window.size() << window.windowTitle() << window.windowIcon().isNull();
        window.close();
        window.readScriptsFile("/none");
        QByteArray refusal = R"({"code": 1})";
        window.analyseEvnData(&refusal);
        window.callloadpolicy(2, "code");
        QByteArray scenes = R"({"code": 0, "message": [{"scene_name": "A", "scene_code": "a"},
                                                        {"scene_name": "B", "scene_code": "b"}]})";
        window.analyseEvnData(&scenes);
        for (const int scene : {1, 0})
            window.findChild<QComboBox*>()->setCurrentIndex(scene);
        window.resetUIPos();
        window.findChild<QAbstractButton*>("NetInfo")->click();
    }

    /// What other programs of the session ask for.
    static void useSession()
    {
        MainWindow window(nullptr, 1020);
        const SessionHost host(window);
        // The bus has the objects already.
        const SessionHost second(window);
        QObject* object = QDBusConnection::sessionBus().objectRegisteredAt("/com/vantor/tarn/Notification");
        auto* notification = qobject_cast<Notification*>(object);
        notification->Notify(1, "lisi", "title", "text", "sender");
        notification->GioMount("maker", "product", "serial", "no id");
        notification->Notify(1, "zhangsan", "title", "text", "sender");
    }

    static void useDialogs()
    {
        resumeDialog verification;
        verification.setIpPort("server", "");
        verification.Notify("text", "/fix");
        verification.hideWindow();
        verification.Notify("open", "true");
        verification.Notify("close", "false");
        verification.confirmCliked();
        verification.getDeviceIntegralityVarifyScript();
        verification.close();
        verification.Notify("success", "/fix");
        verification.close();
        spinerWin().close();
        closeGuarddialog release;
        release.setUsrname("zhangsan");
        release.getMachineId();
        ModifyDialog().onRestoreFinishedprocess();
    }

private slots:
    void initTestCase()
    {
        QNotification::qInstance = new QNotification;
        testfiles::remove(testfiles::kMachineFile);
    }

    void widgets_data() { fixture::addRows("windows.json"); }
    void widgets()
    {
        QFETCH(QJsonObject, row);
        const std::unique_ptr<QWidget> window(make(QTest::currentDataTag()));
        description::compare(window.get(), row["widgets"]);
    }

    void logLines_data() { fixture::addRows("windowlogs.json"); }
    void logLines()
    {
        QFETCH(QJsonObject, row);
        const std::map<QString, std::function<void()>> uses{{"account", useAccount},
                                                            {"window", [] { useWindow(1020); }},
                                                            {"newer window", [] { useWindow(1030); }},
                                                            {"dialogs", useDialogs},
                                                            {"session", useSession}};
        const LogCapture log;
        uses.at(QTest::currentDataTag())();
        fixture::compareLog(log, row["log"]);
    }
};

QTEST_MAIN(TestWindows)
#include "test_windows.moc"

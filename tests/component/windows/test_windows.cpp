// SPDX-License-Identifier: Apache-2.0
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
#include "toolkitapplication.h"
#include "toolkitlabel.h"

#include <QDBusConnectionInterface>

namespace
{

/// What of the window's visible texts and buttons is cut off or partly hidden.
QStringList cutOff(const QWidget& window)
{
    QStringList cut;
    for (const QWidget* widget : window.findChildren<QWidget*>()) {
        const QString text = widget->property("text").toString() + widget->property("placeholderText").toString();
        const auto* label = qobject_cast<const ToolkitLabel*>(widget);
        const auto* edit = qobject_cast<const QLineEdit*>(widget);
        const bool button = widget->inherits("QAbstractButton");
        if (widget->window() != &window || !widget->isVisible() || (text.isEmpty() && !button))
            continue;
        // What a control takes from the text on both sides together.
        const int around = edit                            ? edit->textMargins().left() + edit->textMargins().right()
                           : widget->inherits("QCheckBox") ? 20
                           : button                        ? 4
                                                           : 0;
        const QRect area = widget->contentsRect();
        const QRect ink = widget->fontMetrics().tightBoundingRect(text).translated(0, label ? label->baseline() : 0);
        const QFontMetrics metrics = widget->fontMetrics();
        // Qt rounds the width of an elided text up.
        const int width =
            label ? metrics.horizontalAdvance(text) - 1 : metrics.size(Qt::TextShowMnemonic, text).width() + around;
        const bool fits = label && label->wordWrap() ? label->heightForWidth(area.width()) <= area.height()
                          : label ? width <= area.width() && ink.top() >= area.top() && ink.bottom() <= area.bottom()
                                  : width <= area.width() && ink.height() <= area.height();
        if (!fits || widget->visibleRegion().boundingRect() != widget->rect())
            cut += QString("%1 \"%2\"").arg(widget->metaObject()->className(), text);
    }
    return cut;
}

} // namespace

/// The names, texts and sizes of each window's widgets, read from the widgets, and what the windows log when used. The
/// environment says at which scale.
class TestWindows : public QObject
{
    Q_OBJECT

    /// Values that end so, on the page that is left for the other one where they end in nothing.
    static void fill(InfoWidget& panel, const QString& end)
    {
        panel.setLoginInfo({"a" + end, "b" + end, "c" + end, "d" + end, "e" + end, "f" + end});
        panel.setNetInfo({"1" + end, "2" + end, "3" + end, "4" + end, "5" + end, "6" + end, "7" + end, "8" + end});
        for (const char* page : {"NetInfo", end.isEmpty() ? "LoginInfo" : "NetInfo"})
            panel.findChild<QAbstractButton*>(page)->click();
    }
    static QWidget* make(const QString& name)
    {
        if (name.startsWith("panel")) {
            auto* panel = new InfoWidget(nullptr, name.endsWith("administrator"));
            panel->setSceneBox(name.endsWith("administrator"));
            if (name.contains("values"))
                fill(*panel, name.contains("long") ? QString("<i>").repeated(12) : QString());
            return panel;
        }
        if (name == "main window")
            return new MainWindow(nullptr, 1020);
        if (name == "icon button") {
            auto* button = new IconButton(nullptr);
            button->setFixedSize(button->minimumSizeHint());
            return button;
        }
        if (name == "password")
            return new ModifyDialog;
        if (name == "message") {
            auto* message = new NoticeDialog("zhangsan", nullptr);
            message->nextButton()->setText("下一条(...)");
            return message;
        }
        if (name == "verification") {
            auto* dialog = new resumeDialog;
            dialog->setRepairTitle("关键文件被修改：/usr/bin/login");
            return dialog;
        }
        if (name == "release")
            return new closeGuarddialog;
        auto* progress = new spinerWin;
        if (name == "released")
            progress->onRemoveController();
        return progress;
    }

    static void useWindow(int version)
    {
        MainWindow window(nullptr, version);
        window.onActivatedSysTrayIcon(QSystemTrayIcon::Trigger);
        qInfo() << window.windowFlags() << window.size() << window.windowTitle() << window.windowIcon().isNull();
        window.close();
        window.onUserInfo(404, "{");
        window.onCompanyName(404, "{");
        window.readScriptsFile("/none");
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
        QDBusConnection bus = QDBusConnection::sessionBus();
        QDBusConnection other = QDBusConnection::connectToBus(QDBusConnection::SessionBus, "other");
        other.registerService("com.vantor.tarn");
        MainWindow window(nullptr, 1020);
        std::make_unique<SessionHost>(window);
        qInfo() << bus.objectRegisteredAt("/com/vantor/tarn/Notification")
                << bus.objectRegisteredAt("/com/vantor/tarn/Fullzone");
        other.unregisterService("com.vantor.tarn");
        std::make_unique<SessionHost>(window);
        qInfo() << bus.interface()->isServiceRegistered("com.vantor.tarn").value();
        const SessionHost host(window);
        // The bus has the objects already.
        const SessionHost second(window);
        QObject* object = bus.objectRegisteredAt("/com/vantor/tarn/Notification");
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
        QCOMPARE(qApp->devicePixelRatio(), qEnvironmentVariable("QT_SCALE_FACTOR", "1").toDouble());
    }

    void widgets_data() { fixture::addRows("windows.json"); }
    void widgets()
    {
        QFETCH(QJsonObject, row);
        const std::unique_ptr<QWidget> window(make(QTest::currentDataTag()));
        description::compare(window.get(), row["widgets"]);
        window->show();
        for (const char* page : {"LoginInfo", "NetInfo"}) {
            if (auto* link = window->findChild<QAbstractButton*>(page))
                link->click();
            QTest::qWait(0);
            fixture::compareLines(cutOff(*window), row["cut"].toObject()[page]);
        }
    }

    void logLines_data() { fixture::addRows("windowlogs.json"); }
    void logLines()
    {
        QFETCH(QJsonObject, row);
        const std::map<QString, std::function<void()>> uses{{"window", [] { useWindow(1020); }},
                                                            {"newer window", [] { useWindow(1030); }},
                                                            {"dialogs", useDialogs},
                                                            {"session", useSession}};
        const LogCapture log;
        uses.at(QTest::currentDataTag())();
        fixture::compareLog(log, row["log"]);
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication::loadPlatformPlugin();
    ToolkitApplication application(argc, argv);
    TestWindows test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_windows.moc"

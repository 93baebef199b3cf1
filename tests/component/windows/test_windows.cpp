// SPDX-License-Identifier: Apache-2.0
#include "account.h"
#include "closeguarddialog.h"
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
#include "themehelper.h"
#include "toolkitblurframe.h"

#include <QAbstractButton>
#include <QComboBox>
#include <QDBusConnection>
#include <QGridLayout>
#include <QRegularExpression>

/// The names, texts and sizes of each window's widgets, read from the widgets, and what the windows log when used.
class TestWindows : public QObject
{
    Q_OBJECT

    /// A size that is fixed, or its bounds where it has any; the rest is the font's and the layout's.
    static QString bounds(int least, int most)
    {
        if (least == most)
            return QString::number(least);
        return (least > 0 ? QString::number(least) : "") + '-' + (most < QWIDGETSIZE_MAX ? QString::number(most) : "");
    }

    /// What a layout leaves around and between its items.
    static QString spaces(const QLayout* layout)
    {
        const QMargins margins = layout->contentsMargins();
        return QString(" layout %1,%2,%3,%4 %5")
                   .arg(margins.left())
                   .arg(margins.top())
                   .arg(margins.right())
                   .arg(margins.bottom())
                   .arg(layout->spacing()) +
               items(layout);
    }

    /// The items of a layout in order, w for a widget, with their stretch and alignment, which windows depend on.
    static QString items(const QLayout* layout)
    {
        QString text;
        for (int i = 0; i < layout->count(); ++i) {
            QLayoutItem* item = layout->itemAt(i);
            text += item->widget() ? " w" : item->layout() ? " (" + spaces(item->layout()) + ")" : " s";
            if (QSpacerItem* spacer = item->spacerItem())
                text += QString("%1x%2").arg(spacer->sizeHint().width()).arg(spacer->sizeHint().height());
            const auto* box = qobject_cast<const QBoxLayout*>(layout);
            if (box && box->stretch(i) > 0)
                text += '*' + QString::number(box->stretch(i));
            if (const auto* grid = qobject_cast<const QGridLayout*>(layout)) {
                int row = 0, column = 0, rows = 0, columns = 0;
                grid->getItemPosition(i, &row, &column, &rows, &columns);
                text += QString("%1,%2").arg(row).arg(column);
            }
            if (item->alignment())
                text += '@' + QString::number(item->alignment());
        }
        return text;
    }

    /// The font that the widget was given, and its colours where they are not those of the light theme.
    static QString looks(const QWidget* widget)
    {
        QString text;
        const QFont font = widget->testAttribute(Qt::WA_SetFont) ? widget->font() : QApplication::font();
        if (font.family() != QApplication::font().family())
            text += QString(" font %1 %2").arg(font.family()).arg(font.pixelSize() > 0 ? 0 : font.pointSize());
        if (font.pixelSize() > 0 || font.weight() != QFont::Normal)
            text += QString(" %1px %2").arg(font.pixelSize()).arg(font.weight());
        static const auto kRoles = QMetaEnum::fromType<QPalette::ColorRole>();
        static const QPalette kLight = ThemeHelper::palette(ThemeHelper::LightType);
        for (int role = 0; widget->testAttribute(Qt::WA_SetPalette) && role < QPalette::NColorRoles; ++role) {
            const QColor color = widget->palette().color(QPalette::ColorRole(role));
            if (color != kLight.color(QPalette::ColorRole(role)))
                text += QString(" %1 %2").arg(kRoles.valueToKey(role), color.name(QColor::HexArgb));
        }
        return text;
    }

    /// The value as text, with an asterisk for what the present time gives.
    static QString withoutDate(const QWidget* widget, const QVariant& value)
    {
        QString text = fixture::text(QJsonValue::fromVariant(value));
        static const QStringList kDates{"dateTimeLabel", "CdateTimeLabel", "loginValue"};
        if (value.type() != QVariant::String || !kDates.contains(widget->objectName()))
            return text;
        return text.replace(QRegularExpression("\\d+|星期.|..年.*月.."), "*");
    }

    static QString describe(const QWidget* widget, const QWidget* window)
    {
        QString line = QString("%1 \"%2\"").arg(widget->metaObject()->className(), widget->objectName());
        line += QString(" %1x%2").arg(bounds(widget->minimumWidth(), widget->maximumWidth()),
                                      bounds(widget->minimumHeight(), widget->maximumHeight()));
        if (widget != window && !widget->parentWidget()->layout())
            line += QString(" at %1,%2").arg(widget->x()).arg(widget->y());
        if (widget->layout())
            line += spaces(widget->layout());
        if (const auto* frame = qobject_cast<const ToolkitBlurFrame*>(widget))
            line +=
                QString(" mask %1 %2 %3").arg(frame->maskColor().name()).arg(frame->maskAlpha()).arg(frame->radius());
        for (const char* property :
             {"windowTitle", "accessibleName", "text", "placeholderText", "alignment", "echoMode", "readOnly",
              "default", "styleSheet", "toolTip", "wordWrap", "maxLength"}) {
            const QVariant value = widget->property(property);
            if (value.isValid() && value != QVariant(QString()))
                line += QString(" %1=%2").arg(property, withoutDate(widget, value));
        }
        if (const auto* button = qobject_cast<const QAbstractButton*>(widget))
            line += QString(" icon %1 %2").arg(button->iconSize().width()).arg(!button->icon().isNull());
        const QPair<bool, const char*> states[] = {{!widget->isVisibleTo(window), " hidden"},
                                                   {!widget->isEnabled(), " disabled"},
                                                   {widget->isModal(), " modal"},
                                                   {(widget->focusPolicy() & Qt::TabFocus) != 0, " tab"}};
        for (const auto& [holds, word] : states)
            line += holds ? word : "";
        return line + looks(widget);
    }

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
        QStringList got{describe(window.get(), window.get())};
        for (const QWidget* widget : window->findChildren<QWidget*>())
            got.append(describe(widget, window.get()));
        QStringList expected = row["widgets"].toVariant().toStringList();
        QCOMPARE(got.size(), expected.size());
        for (int i = 0; i < got.size(); ++i)
            QCOMPARE(got[i], expected[i]);
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

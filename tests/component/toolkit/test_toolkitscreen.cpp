// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "compositor.h"
#include "description.h"
#include "instancelock.h"
#include "portal.h"
#include "queuedinput.h"
#include "timelimits.h"
#include "toolkitapplication.h"
#include "toolkitblurframe.h"
#include "toolkitpasswordedit.h"
#include "widgets.h"

#include <QProcess>

#include <unistd.h>
#include <xcb/shape.h>

namespace
{

/// What the server has as the window's shape, in bands from the top.
QStringList shape(const QWidget& window)
{
    const auto cookie = xcb_shape_get_rectangles(QX11Info::connection(), window.winId(), XCB_SHAPE_SK_BOUNDING);
    const auto reply = xwindows::owned(xcb_shape_get_rectangles_reply(QX11Info::connection(), cookie, nullptr));
    const xcb_rectangle_t* bands = xcb_shape_get_rectangles_rectangles(reply.get());
    QStringList shape;
    for (int i = 0; i < xcb_shape_get_rectangles_rectangles_length(reply.get()); ++i)
        shape += QString("%1,%2 %3x%4").arg(bands[i].x).arg(bands[i].y).arg(bands[i].width).arg(bands[i].height);
    return shape;
}

/// The rectangles behind the window that are to be blurred.
QVector<quint32> blurred(const QWidget& window)
{
    return xwindows::property(window.winId(), kBlurProperty);
}

} // namespace

/// What only an X server shows of the toolkit.
class TestToolkitScreen : public QObject
{
    Q_OBJECT

private slots:
    // The first, since the program asks the portal once.
    void themeFollowsThePortal()
    {
        Portal portal;
        QDBusConnection bus = QDBusConnection::sessionBus();
        QVERIFY(bus.registerService("org.freedesktop.portal.Desktop"));
        bus.registerObject("/org/freedesktop/portal/desktop", &portal, QDBusConnection::ExportAllSlots);
        const QSignalSpy changed(ThemeHelper::instance(), &ThemeHelper::themeTypeChanged);
        const ToolkitDialog dialog;
        QTRY_COMPARE(changed.count(), 1);
        QCOMPARE(portal.asked, "org.freedesktop.appearance color-scheme");
        QTRY_VERIFY(ThemeHelper::instance()->children().isEmpty());
        const QPalette before = QApplication::palette();
        for (const QJsonValue& change : fixture::read("themechanges.json")["changes"].toArray()) {
            const QString setting = change["setting"].toString();
            const int value = change["value"].toInt();
            const auto type = change["dark"].toBool() ? ThemeHelper::DarkType : ThemeHelper::LightType;
            // The palette decides, by its lightness, while the portal has no preference.
            QPalette palette = before;
            palette.setColor(QPalette::Window, QColor(value, value, value));
            if (setting == "palette")
                QApplication::setPalette(palette);
            else
                Portal::change(setting.section(' ', 0, 0), setting.section(' ', 1), uint(value));
            QTRY_COMPARE(ThemeHelper::instance()->themeType(), type);
            QCOMPARE(changed.last().constFirst().value<ThemeHelper::ColorType>(), type);
            QCOMPARE(dialog.palette(), ThemeHelper::palette(type));
        }
        QCOMPARE(changed.count(), 8);
        QApplication::setPalette(before);
    }

    void cornersAreCutWithoutCompositor()
    {
        ToolkitBlurFrame frame;
        frame.resize(200, 100);
        QVERIFY(shown(frame));
        const QStringList round{"9,0 182x1", "6,1 188x1", "5,2 190x1", "4,3 192x1",
                                "3,4 194x1", "2,5 196x1", "1,6 198x3", "0,9 200x82"};
        QCOMPARE(shape(frame).mid(0, 8), round);
        frame.setRadius(4);
        QCOMPARE(shape(frame), (QStringList{"2,0 196x1", "1,1 198x1", "0,2 200x96", "1,98 198x1", "2,99 196x1"}));
        frame.resize(120, 60);
        const QStringList smaller{"2,0 116x1", "1,1 118x1", "0,2 120x56", "1,58 118x1", "2,59 116x1"};
        QTRY_COMPARE(shape(frame), smaller);
        frame.setRadius(-1);
        QCOMPARE(frame.radius(), 0);
        // New flags make a new native window.
        frame.setRadius(4);
        frame.setWindowFlags(frame.windowFlags() | Qt::Tool);
        frame.show();
        QCOMPARE(shape(frame), smaller);
        QWidget parent;
        const ToolkitBlurFrame panel(&parent);
        QVERIFY(!panel.isWindow() && frame.windowFlags().testFlag(Qt::FramelessWindowHint));
    }

    void compositorBlendsAndBlurs()
    {
        ToolkitBlurFrame frame;
        frame.resize(200, 100);
        QVERIFY(shown(frame));
        const auto corner = [&frame] { return frame.grab().toImage().pixelColor(0, 0).alpha(); };
        QCOMPARE(blurred(frame), QVector<quint32>());
        QCOMPARE(corner(), 255);
        {
            const Compositor compositor;
            frame.update();
            QTRY_COMPARE(shape(frame), QStringList{"0,0 200x100"});
            QVERIFY(corner() < 20);
            const QVector<quint32> region = blurred(frame);
            QCOMPARE(region.mid(0, 4), (QVector<quint32>{9, 0, 182, 1}));
            // Drawing alone asks for nothing again.
            xwindows::setProperty(frame.winId(), kBlurProperty, {7});
            frame.repaint();
            QCoreApplication::sendPostedEvents();
            QCOMPARE(blurred(frame), QVector<quint32>{7});
            frame.setMaskAlpha(255);
            QCOMPARE(blurred(frame), QVector<quint32>());
            frame.setMaskAlpha(254);
            QCOMPARE(blurred(frame), region);
            ToolkitDialog dialog;
            dialog.show();
            QVERIFY(QTest::qWaitForWindowExposed(&dialog));
            QCOMPARE(blurred(dialog), QVector<quint32>());
        }
        frame.update();
        QTRY_COMPARE(shape(frame).size(), 15);
    }

    void boxesLieOverTheirWindow_data() { fixture::addRows("boxes.json"); }
    void boxesLieOverTheirWindow()
    {
        QFETCH(QJsonObject, row);
        QWidget window(nullptr, Qt::FramelessWindowHint | Qt::X11BypassWindowManagerHint);
        window.setGeometry(rect(row["window"]));
        window.show();
        QVERIFY(QTest::qWaitForWindowExposed(&window));
        BoxCloser closer;
        closer.instead = [&window, &row] {
            auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
            description::compare(box, row["widgets"]);
            const QRect got = box->geometry();
            const QRect screen = box->screen()->availableGeometry();
            // Its left edge; whether it is level with its window, and whether it touches the edges of the screen.
            const bool level = std::abs((got.center() - window.geometry().center()).y()) <= 1;
            fixture::compare(QJsonArray{got.left(), level, got.top() == screen.top(), got.bottom() == screen.bottom()},
                             row["place"]);
            const QImage sign = box->windowIcon().pixmap(64).toImage();
            const QImage picture(QString(ZENT_TEST_DATA "/pictures/") + row["sign"].toString());
            const QString other = qEnvironmentVariable("ROOM") + "/" + row["sign"].toString();
            QVERIFY2(sign == picture.convertToFormat(sign.format()) || !sign.save(other), qPrintable(other));
            box->close();
        };
        const auto kind = QMetaEnum::fromType<ToolkitDialog::BoxKind>().keyToValue(qPrintable(row["kind"].toString()));
        ToolkitDialog::tell(&window, row["text"].toString(), row["title"].toString(), ToolkitDialog::BoxKind(kind));
        fixture::compare(closer.texts.constFirst(), row["title"].toString() + row["text"].toString());
        QVERIFY(window.findChildren<ToolkitDialog*>().isEmpty());
    }

    void dialogGivesTheKeyboardBack_data() { fixture::addRows("keyboard.json"); }
    void dialogGivesTheKeyboardBack()
    {
        QFETCH(QJsonObject, row);
        // Qt gives the keyboard to a parent that takes it.
        QWidget window(nullptr, row["refuses"].toBool() ? Qt::WindowDoesNotAcceptFocus : Qt::Widget);
        window.show();
        ToolkitDialog dialog(row["parent"].toBool() ? &window : nullptr);
        dialog.show();
        QWidget* active = row["inactive"].toBool() ? &window : &dialog;
        QVERIFY(QTest::qWaitForWindowExposed(&window) && QTest::qWaitForWindowExposed(&dialog));
        active->activateWindow();
        QTRY_COMPARE(QApplication::activeWindow(), active);
        const auto before = QX11Info::appUserTime();
        const LogCapture log;
        dialog.hide();
        QCOMPARE(singleShots(200), row["waits"].toInt());
        window.setHidden(row["hidden"].toBool());
        QTRY_COMPARE(singleShots(200), 0);
        QCOMPARE(QX11Info::appUserTime() > before, row["asks"].toBool());
        QCOMPARE(log.count("requestActivate() called"), row["asks"].toBool() ? 1 : 0);
    }

    void capsLockIsShownInTheField()
    {
        QWidget window;
        ToolkitPasswordEdit edit(&window);
        QLineEdit other(&window);
        edit.resize(200, 36);
        QVERIFY(shown(window));
        edit.setFocus();
        const auto* sign = edit.findChild<QWidget*>("capsLockSign");
        const auto pressed = [] { return QProcess::execute("xdotool", {"key", "Caps_Lock"}) == 0; };
        QVERIFY(!sign->isVisible() && pressed());
        QTRY_VERIFY(sign->isVisible());
        QCOMPARE(sign->pos(), QPoint(140, 4));
        QCOMPARE(edit.textMargins().right(), 60);
        other.setFocus();
        QVERIFY(!sign->isVisible());
        edit.setFocus();
        QVERIFY(sign->isVisible() && pressed());
        QTRY_VERIFY(!sign->isVisible());
        QCOMPARE(edit.textMargins().right(), 32);
        // What was selected goes with the text, but not what another program has selected.
        edit.setText("secret");
        edit.findChild<QAbstractButton*>("echoButton")->click();
        QTest::keyClick(&edit, Qt::Key_Home, Qt::ShiftModifier);
        QVERIFY(QGuiApplication::clipboard()->ownsSelection());
        edit.clear();
        QVERIFY(!QGuiApplication::clipboard()->ownsSelection());
    }

    void inputThatWaitedIsDropped()
    {
        QLineEdit edit;
        queuedinput::discard();
        const auto now = quint32(QX11Info::getTimestamp());
        // What comes after the waiting is over ends the dropping.
        const std::tuple<char, quint32, bool> keys[] = {
            {'a', now - 1000, true}, {'b', 0, false},       {'c', now - 0x7fffff00, true}, {'d', now + 10, false},
            {'e', now - 1000, true}, {'f', now + 10, true}, {'g', now - 1000, true}};
        for (const auto& [letter, time, spontaneous] : keys) {
            QKeyEvent event(QEvent::KeyPress, 0, Qt::NoModifier, QString(letter));
            event.setTimestamp(time);
            if (spontaneous)
                QSpontaneKeyEvent::setSpontaneous(&event);
            qApp->notify(&edit, &event);
        }
        QCOMPARE(edit.text(), "bdfg");
        queuedinput::discard();
        QTest::mouseClick(&edit, Qt::LeftButton);
        QResizeEvent resized({1, 1}, {2, 2});
        QApplication::sendEvent(&edit, &resized);
    }

    void applicationPreparesTheDesktop()
    {
        QVERIFY(!qEnvironmentVariableIsSet("QT_QPA_PLATFORM"));
        QCOMPARE(QGuiApplication::platformName(), "xcb");
        QVERIFY(QCoreApplication::testAttribute(Qt::AA_EnableHighDpiScaling));
        QVERIFY(QCoreApplication::testAttribute(Qt::AA_UseHighDpiPixmaps));
        QVERIFY(!QGuiApplication::isFallbackSessionManagementEnabled());
        for (const char* family : {"Source Han Sans CN", "SourceHanSansSC", "SourceHanSansSC-Medium",
                                   "SourceHanSansSC-Medium,SourceHanSansSC", "Microsoft YaHei"})
            QCOMPARE(QFont::substitutes(family),
                     (QStringList{"noto sans cjk sc", "source han sans sc", "noto sans sc", "wenquanyi micro hei"}));
        const QString directory = "/run/user/" + QString::number(getuid());
        QFile::setPermissions(directory, QFile::ReadOwner | QFile::ExeOwner);
        const LogCapture log;
        auto* application = static_cast<ToolkitApplication*>(qApp);
        QVERIFY(application->setSingleInstance("some key"));
        QCOMPARE(log.records().last(), "warning running without the single-instance lock for some key");
        QFile::setPermissions(directory, QFile::ReadOwner | QFile::WriteOwner | QFile::ExeOwner);
        InstanceLock holder;
        QCOMPARE(holder.acquire(directory, "held"), InstanceLock::Result::Acquired);
        QVERIFY(!application->setSingleInstance("held") && application->setSingleInstance("free"));
        QVERIFY(application->setSingleInstance("free"));
        // What is no folder is nobody's folder.
        QVERIFY(QDir().rename(directory, directory + "-aside"));
        testfiles::write(directory, "");
        const QByteArray runtime = qgetenv("XDG_RUNTIME_DIR");
        const QTemporaryDir another;
        qputenv("XDG_RUNTIME_DIR", another.path().toLocal8Bit());
        QCOMPARE(InstanceLock::userDirectory(), another.path());
        qputenv("XDG_RUNTIME_DIR", runtime);
        QVERIFY(QFile::remove(directory) && QDir().rename(directory + "-aside", directory));
        QCOMPARE(InstanceLock::userDirectory(), directory);
    }

    void platformPluginIsTheUsersOrOfTheDisplay()
    {
        const QByteArray display = qgetenv("DISPLAY");
        const std::tuple<const char*, const char*, QByteArray> rows[] = {
            {":1", "", "xcb;wayland"}, {"", "", ""}, {":1", "offscreen", "offscreen"}, {"", "offscreen", "offscreen"}};
        for (const auto& [shown, chosen, plugin] : rows) {
            qputenv("DISPLAY", shown);
            *chosen ? qputenv("QT_QPA_PLATFORM", chosen) : qunsetenv("QT_QPA_PLATFORM");
            ToolkitApplication::loadPlatformPlugin();
            QCOMPARE(qgetenv("QT_QPA_PLATFORM"), plugin);
        }
        qputenv("DISPLAY", display);
        qunsetenv("QT_QPA_PLATFORM");
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication::loadPlatformPlugin();
    ToolkitApplication application(argc, argv);
    TestToolkitScreen test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_toolkitscreen.moc"

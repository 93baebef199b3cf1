// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "compositor.h"
#include "fixture.h"
#include "instancelock.h"
#include "portal.h"
#include "queuedinput.h"
#include "timelimits.h"
#include "toolkitapplication.h"
#include "toolkitblurframe.h"
#include "toolkitpasswordedit.h"

#include <QAbstractButton>
#include <QClipboard>
#include <QLabel>
#include <QLayout>
#include <QProcess>
#include <QScreen>

#include <unistd.h>
#include <xcb/shape.h>

namespace
{

/// What the server has as the window's shape: the pixels that are missing at the left of each row, until none are.
QList<int> insets(const QWidget& window, int& rows)
{
    const auto cookie = xcb_shape_get_rectangles(QX11Info::connection(), window.winId(), XCB_SHAPE_SK_BOUNDING);
    const auto reply = xwindows::owned(xcb_shape_get_rectangles_reply(QX11Info::connection(), cookie, nullptr));
    QRegion region;
    const xcb_rectangle_t* rectangles = xcb_shape_get_rectangles_rectangles(reply.get());
    for (int i = 0; i < xcb_shape_get_rectangles_rectangles_length(reply.get()); ++i)
        region += QRect(rectangles[i].x, rectangles[i].y, rectangles[i].width, rectangles[i].height);
    rows = region.boundingRect().height();
    QList<int> insets;
    for (int y = 0; y < rows; ++y) {
        const QRect row = (region & QRect(0, y, 10000, 1)).boundingRect();
        const QRect mirrored = (region & QRect(0, rows - 1 - y, 10000, 1)).boundingRect();
        if (row.left() == 0)
            break;
        const bool even = row.right() == window.width() - 1 - row.left() && mirrored.left() == row.left();
        insets.append(even ? row.left() : -1);
    }
    return insets;
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

    /// Where a box lies: in the middle of its window, and at which edges of the screen.
    static QString place(const QRect& box, const QRect& window)
    {
        const QRect screen = QGuiApplication::primaryScreen()->availableGeometry();
        QStringList words;
        const QPoint off = box.center() - window.center();
        if (std::abs(off.x()) <= 1)
            words.append("centred");
        if (std::abs(off.y()) <= 1)
            words.append("level");
        const std::pair<bool, const char*> edges[] = {{box.left() == screen.left(), "left"},
                                                      {box.top() == screen.top(), "top"},
                                                      {box.right() == screen.right(), "right"},
                                                      {box.bottom() == screen.bottom(), "bottom"}};
        for (const auto& [touches, edge] : edges) {
            if (touches)
                words.append(edge);
        }
        return words.join(' ');
    }

private slots:
    // The first, since the program asks the portal once.
    void themeFollowsThePortal()
    {
        Portal portal;
        QDBusConnection bus = QDBusConnection::sessionBus();
        QVERIFY(bus.registerService("org.freedesktop.portal.Desktop"));
        bus.registerObject("/org/freedesktop/portal/desktop", &portal, QDBusConnection::ExportAllSlots);
        const QSignalSpy changed(ThemeHelper::instance(), &ThemeHelper::themeTypeChanged);
        QTRY_COMPARE(changed.count(), 1);
        QCOMPARE(portal.asked, "org.freedesktop.appearance color-scheme");
        QTRY_VERIFY(ThemeHelper::instance()->children().isEmpty());
        QCOMPARE(ThemeHelper::instance()->themeType(), ThemeHelper::DarkType);
        const ToolkitDialog dialog;
        const auto surface = [&dialog] { return dialog.palette().color(QPalette::Window).lightness(); };
        QVERIFY(surface() < 50);
        Portal::change("org.freedesktop.appearance", "contrast", 2U);
        Portal::change("org.other", "color-scheme", 2U);
        Portal::change("org.freedesktop.appearance", "color-scheme", 1U);
        Portal::change("org.freedesktop.appearance", "color-scheme", 2U);
        QTRY_COMPARE(changed.count(), 2);
        QCOMPARE(changed.last().constFirst().value<ThemeHelper::ColorType>(), ThemeHelper::LightType);
        QVERIFY(surface() > 200);
        // Without a preference the palette decides.
        Portal::change("org.freedesktop.appearance", "color-scheme", 1U);
        Portal::change("org.freedesktop.appearance", "color-scheme", 0U);
        QTRY_COMPARE(changed.count(), 4);
        QCOMPARE(ThemeHelper::instance()->themeType(), ThemeHelper::LightType);
        const QPalette before = QApplication::palette();
        for (const auto& [lightness, type] : {std::pair{127, ThemeHelper::DarkType}, {128, ThemeHelper::LightType}}) {
            QPalette palette = before;
            palette.setColor(QPalette::Window, QColor(lightness, lightness, lightness));
            QApplication::setPalette(palette);
            QTRY_COMPARE(ThemeHelper::instance()->themeType(), type);
        }
        // A preference beats a dark palette.
        QPalette dark = before;
        dark.setColor(QPalette::Window, Qt::black);
        QApplication::setPalette(dark);
        QTRY_COMPARE(ThemeHelper::instance()->themeType(), ThemeHelper::DarkType);
        Portal::change("org.freedesktop.appearance", "color-scheme", 2U);
        QTRY_COMPARE(ThemeHelper::instance()->themeType(), ThemeHelper::LightType);
        QApplication::setPalette(before);
    }

    void cornersAreCutWithoutCompositor()
    {
        ToolkitBlurFrame frame;
        frame.resize(200, 100);
        frame.show();
        QVERIFY(QTest::qWaitForWindowActive(&frame));
        int rows = 0;
        QCOMPARE(insets(frame, rows), (QList<int>{9, 6, 5, 4, 3, 2, 1, 1, 1}));
        QCOMPARE(rows, 100);
        frame.setRadius(4);
        QCOMPARE(insets(frame, rows), (QList<int>{2, 1}));
        frame.resize(120, 60);
        QTRY_VERIFY(insets(frame, rows) == (QList<int>{2, 1}) && rows == 60);
        frame.setRadius(-1);
        QCOMPARE(frame.radius(), 0);
        // New flags make a new native window.
        frame.setRadius(4);
        frame.setWindowFlags(frame.windowFlags() | Qt::Tool);
        frame.show();
        QCOMPARE(insets(frame, rows), (QList<int>{2, 1}));
        QWidget parent;
        const ToolkitBlurFrame panel(&parent);
        QVERIFY(!panel.isWindow() && frame.windowFlags().testFlag(Qt::FramelessWindowHint));
    }

    void compositorBlendsAndBlurs()
    {
        ToolkitBlurFrame frame;
        frame.resize(200, 100);
        frame.show();
        QVERIFY(QTest::qWaitForWindowActive(&frame));
        const auto corner = [&frame] { return frame.grab().toImage().pixelColor(0, 0).alpha(); };
        int rows = 0;
        QCOMPARE(blurred(frame), QVector<quint32>());
        QCOMPARE(corner(), 255);
        {
            const Compositor compositor;
            frame.update();
            QTRY_VERIFY(insets(frame, rows).isEmpty());
            QVERIFY(corner() < 20);
            const QVector<quint32> region = blurred(frame);
            QCOMPARE(region.mid(0, 4), (QVector<quint32>{9, 0, 182, 1}));
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
        QTRY_COMPARE(insets(frame, rows).size(), 9);
    }

    void boxesLieOverTheirWindow_data() { fixture::addRows("boxes.json"); }
    void boxesLieOverTheirWindow()
    {
        QFETCH(QJsonObject, row);
        QWidget window(nullptr, Qt::FramelessWindowHint | Qt::X11BypassWindowManagerHint);
        const QList<QVariant> sides = row["window"].toArray().toVariantList();
        window.setGeometry(sides[0].toInt(), sides[1].toInt(), sides[2].toInt(), sides[3].toInt());
        window.show();
        QVERIFY(QTest::qWaitForWindowExposed(&window));
        BoxCloser closer;
        QJsonObject got;
        closer.instead = [&got, &window, &row] {
            auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
            got["place"] = place(box->geometry(), window.geometry());
            const QImage sign = box->windowIcon().pixmap(64).toImage();
            const QImage picture(QString(ZENT_TEST_DATA "/pictures/") + row["sign"].toString());
            if (sign != picture.convertToFormat(sign.format()) &&
                sign.save(qEnvironmentVariable("ROOM") + "/" + row["sign"].toString()))
                got["sign"] = "another";
            QStringList buttons;
            for (const QAbstractButton* button : box->buttons())
                buttons.append(QString(button->metaObject()->className()) + ' ' + button->text() +
                               (button->property("default").toBool() ? " default" : ""));
            got["buttons"] = QJsonArray::fromStringList(buttons);
            got["below"] = box->layout()->contentsMargins().bottom();
            box->close();
        };
        const auto kind = QMetaEnum::fromType<ToolkitDialog::BoxKind>().keyToValue(qPrintable(row["kind"].toString()));
        ToolkitDialog::tell(&window, row["text"].toString(), row["title"].toString(), ToolkitDialog::BoxKind(kind));
        fixture::compare(closer.texts.constFirst(), row["title"].toString() + row["text"].toString());
        QVERIFY(window.findChildren<ToolkitDialog*>().isEmpty());
        fixture::compare(got, row["box"]);
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
        window.show();
        QVERIFY(QTest::qWaitForWindowActive(&window));
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
        const auto type = [&edit](char letter, quint32 time, bool spontaneous) {
            QKeyEvent event(QEvent::KeyPress, 0, Qt::NoModifier, QString(letter));
            event.setTimestamp(time);
            if (spontaneous)
                QSpontaneKeyEvent::setSpontaneous(&event);
            qApp->notify(&edit, &event);
        };
        queuedinput::discard();
        const auto now = quint32(QX11Info::getTimestamp());
        type('a', now - 1000, true);
        type('b', 0, false);
        type('c', now - 0x7fffff00, true);
        type('d', now + 10, false);
        type('e', now - 1000, true);
        QCOMPARE(edit.text(), "bd");
        // What comes after the waiting is over ends the dropping.
        type('f', now + 10, true);
        type('g', now - 1000, true);
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

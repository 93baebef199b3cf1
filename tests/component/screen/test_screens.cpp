// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "screens.h"
#include "showwindow.h"
#include "xwindows.h"

#include <QScreen>
#include <QWidget>

/// Where windows go on a display of two monitors: 1024 x 768, and to its right the primary one of 1280 x 800.
class TestScreens : public QObject
{
    Q_OBJECT

    static QJsonValue sides(const QRect& area) { return QJsonArray{area.x(), area.y(), area.width(), area.height()}; }

private slots:
    /// Comes first: panels change what is available.
    void changesAreSeen()
    {
        int seen = 0;
        QObject context;
        zent::screens::watch(&context, [&seen] { ++seen; });
        QScreen* screen = QGuiApplication::primaryScreen();
        emit screen->geometryChanged({});
        emit screen->availableGeometryChanged({});
        emit qGuiApp->primaryScreenChanged(screen);
        emit qGuiApp->screenRemoved(screen);
        QTRY_COMPARE(seen, 4);
        emit qGuiApp->screenAdded(screen);
        emit screen->geometryChanged({});
        QCOMPARE(seen, 6);
    }

    void workArea_data() { fixture::addRows("workareas.json"); }
    void workArea()
    {
        QFETCH(QJsonObject, row);
        QWidget parent;
        for (const QJsonValue& bands : row["panels"].toArray()) {
            auto* panel = new QWidget(&parent, Qt::Window | Qt::FramelessWindowHint);
            panel->resize(10, 10);
            QVector<quint32> values;
            for (const QJsonValue& value : bands.toArray())
                values.append(quint32(value.toInt()));
            xwindows::setProperty(panel->winId(), values.size() == 4 ? "_NET_WM_STRUT" : "_NET_WM_STRUT_PARTIAL",
                                  values);
            panel->show();
            QVERIFY(QTest::qWaitForWindowExposed(panel));
        }
        QTRY_COMPARE(sides(zent::screens::availableGeometry()), row["area"]);
        QCOMPARE(sides(zent::screens::fullGeometry()), (QJsonArray{1024, 0, 1280, 800}));
        QCOMPARE(zent::screens::all().size(), 2);
    }

    void places()
    {
        QTRY_COMPARE(sides(zent::screens::availableGeometry()), (QJsonArray{1024, 0, 1280, 800}));
        QWidget window(nullptr, Qt::FramelessWindowHint);
        window.resize(300, 200);
        // Measured from the origin, it would stand on both monitors.
        zent::screens::placeBottomRight(window, {0, 0, 1280, 800});
        QCOMPARE(window.pos(), QPoint(2004, 600));
        const std::pair<QPoint, QPoint> moves[] = {
            {{1024, 0}, {1024, 0}}, {{1023, 0}, {2004, 600}}, {{2004, 601}, {2004, 600}}};
        for (const auto& [from, to] : moves) {
            window.move(from);
            zent::screens::keepInWorkArea(window);
            QCOMPARE(window.pos(), to);
        }
        zent::screens::placeCentre(window);
        QCOMPARE(window.pos(), QPoint(490, 300));
        const QList<QRect> all = zent::screens::all();
        QVERIFY(zent::screens::showWhole(all, {1024, 0, 300, 200}) &&
                zent::screens::showWhole(all, {724, 0, 300, 200}));
        QVERIFY(!zent::screens::showWhole(all, {1023, 0, 300, 200}));
    }

    void whatIsShownIsOnTop()
    {
        QWidget first, second;
        QWidget tool(nullptr, Qt::Tool);
        for (QWidget* window : {&first, &second, &first, &tool, &second}) {
            zent::showActive(*window);
            QTRY_VERIFY(window->isActiveWindow());
            QTRY_COMPARE(xwindows::property(QX11Info::appRootWindow(), "_NET_CLIENT_LIST_STACKING").last(),
                         quint32(window->winId()));
            const auto states = xwindows::property(window->winId(), "_NET_WM_STATE");
            for (const char* list : {"_NET_WM_STATE_SKIP_TASKBAR", "_NET_WM_STATE_SKIP_PAGER"})
                QCOMPARE(states.contains(xwindows::atom(list)), window == &tool);
        }
    }
};

QTEST_MAIN(TestScreens)
#include "test_screens.moc"

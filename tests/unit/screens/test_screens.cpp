#include "screens.h"

#include <QtTest>

using namespace zent::screens;

namespace
{

constexpr QSize kPanel(300, 565);
constexpr QSize kPassword(400, 280);
constexpr QSize kNotice(428, 450);

/// The band of 40 that a desktop panel at one edge takes from a screen.
QRect without(const QRect& screen, Qt::Edge edge)
{
    constexpr int band = 40;
    return screen.adjusted(edge == Qt::LeftEdge ? band : 0, edge == Qt::TopEdge ? band : 0,
                           edge == Qt::RightEdge ? -band : 0, edge == Qt::BottomEdge ? -band : 0);
}

} // namespace

/// Where the windows stand on desktops of one and two screens. A layout is its primary screen and, maybe, another.
class TestScreens : public QObject
{
    Q_OBJECT

private slots:
    void panel_data();
    void panel();
    void dialogs_data();
    void dialogs();
};

void TestScreens::panel_data()
{
    QTest::addColumn<QRect>("primary");
    QTest::addColumn<QRect>("other");
    QTest::addColumn<QRect>("available");
    QTest::addColumn<QPoint>("corner"); // the panel's bottom right
    QTest::addColumn<bool>("whole");
    const QRect full(0, 0, 1280, 800);
    QTest::newRow("nothing reserved") << full << QRect() << full << QPoint(1280, 800) << true;
    QTest::newRow("bottom") << full << QRect() << without(full, Qt::BottomEdge) << QPoint(1280, 760) << true;
    QTest::newRow("right") << full << QRect() << without(full, Qt::RightEdge) << QPoint(1240, 800) << true;
    QTest::newRow("left") << full << QRect() << without(full, Qt::LeftEdge) << QPoint(1240, 800) << true;
    QTest::newRow("top") << full << QRect() << without(full, Qt::TopEdge) << QPoint(1280, 760) << true;
    const QRect small(0, 0, 800, 600);
    QTest::newRow("800x600, bottom") << small << QRect() << without(small, Qt::BottomEdge) << QPoint(800, 560) << false;
    // What 1920x1080 and 800x600 are at scale 2.
    const QRect half(0, 0, 960, 540);
    QTest::newRow("lower than the panel") << half << QRect() << half << QPoint(960, 540) << false;
    const QRect quarter(0, 0, 400, 300);
    QTest::newRow("far lower") << quarter << QRect() << quarter << QPoint(400, 300) << false;

    const QRect beside(1280, 0, 1920, 1080);
    const QRect below(0, 800, 1920, 1080);
    for (const Qt::Edge edge : {Qt::LeftEdge, Qt::TopEdge, Qt::BottomEdge}) {
        const QRect available = without(full, edge);
        const QPoint corner(available.width(), available.height());
        QTest::addRow("primary left, panel %d", int(edge)) << full << beside << available << corner << true;
        QTest::addRow("primary above, panel %d", int(edge)) << full << below << available << corner << true;
    }
    QTest::newRow("primary right of a smaller") << beside << full << beside << QPoint(1920, 1080) << true;
    QTest::newRow("primary right of its like") << full.translated(1280, 0) << full << full << QPoint(1280, 800) << true;
    QTest::newRow("primary below a smaller") << below << full << below << QPoint(1920, 1080) << false;
    QTest::newRow("primary below its like") << full.translated(0, 800) << full << full << QPoint(1280, 800) << true;
    QTest::newRow("in the gap beside a lower screen")
        << QRect(1280, 0, 1280, 1024) << full << QRect(1280, 0, 1280, 1024) << QPoint(1280, 1024) << false;
}

void TestScreens::panel()
{
    QFETCH(QRect, primary);
    QFETCH(QRect, other);
    QFETCH(QRect, available);
    QFETCH(QPoint, corner);
    QFETCH(bool, whole);
    const QRect window(bottomRight(available, kPanel), kPanel);
    QCOMPARE(window.bottomRight() + QPoint(1, 1), corner);
    QCOMPARE(showWhole({primary, other}, window), whole);
    // Whatever is cut off is cut off above: the row with the links stays on the screen where the origin is on one.
    if (primary.topLeft().isNull())
        QVERIFY(primary.contains(window.bottomRight()) && window.left() >= 0);
}

void TestScreens::dialogs_data()
{
    QTest::addColumn<QRect>("primary");
    QTest::addColumn<QRect>("other");
    QTest::addColumn<QSize>("size");
    QTest::addColumn<QPoint>("place");
    const QRect full(0, 0, 1280, 800);
    QTest::newRow("one screen") << full << QRect() << kPassword << QPoint(440, 260);
    QTest::newRow("odd sizes") << QRect(0, 0, 1367, 769) << QRect() << QSize(401, 281) << QPoint(483, 244);
    QTest::newRow("primary left") << full << QRect(1280, 0, 1920, 1080) << kNotice << QPoint(426, 175);
    QTest::newRow("primary right") << QRect(1280, 0, 1280, 800) << full << kNotice << QPoint(426, 175);
    QTest::newRow("primary below") << QRect(0, 800, 1280, 800) << full << kPassword << QPoint(440, 260);
    QTest::newRow("800x600 at scale 2") << QRect(0, 0, 400, 300) << QRect() << kPassword << QPoint(0, 10);
}

void TestScreens::dialogs()
{
    QFETCH(QRect, primary);
    QFETCH(QRect, other);
    QFETCH(QSize, size);
    QFETCH(QPoint, place);
    QCOMPARE(centre(primary, size), place);
    QVERIFY(showWhole({primary, other}, QRect(place, size)));
}

QTEST_APPLESS_MAIN(TestScreens)
#include "test_screens.moc"

// The information panel: what it shows, what it reports, and that everything fits.

#include "iconbutton.h"
#include "infowidget.h"
#include "themehelper.h"
#include "toolkitapplication.h"
#include "toolkitbuttonbox.h"
#include "toolkitlabel.h"

#include <QCheckBox>
#include <QComboBox>
#include <QLabel>
#include <QScreen>
#include <QSignalSpy>
#include <QToolButton>
#include <QVBoxLayout>
#include <QtTest>

namespace
{

const QString longName = QString(60, QChar(0x7ec4)); // 组

TLoginInfo loginInfo()
{
    return {QStringLiteral("办公终端"), QStringLiteral("数据中心"), QStringLiteral("王小明"),
            QStringLiteral("20190412"), QStringLiteral("spare"),    QStringLiteral("运维处")};
}

TNetInfo netInfo()
{
    return {QStringLiteral("Ag-host"),     QStringLiteral("(gypsy)"),     QStringLiteral("52:54:00:ab:cd:ef"),
            QStringLiteral("192.168.1.9"), QStringLiteral("192.168.1.1"), QStringLiteral("192.168.1.2"),
            QStringLiteral("255.255.0.0"), QStringLiteral("1000 Mb/s")};
}

QLabel* label(const QWidget& panel, const char* name)
{
    return panel.findChild<QLabel*>(QLatin1String(name));
}

/// Whether the label cuts off no glyph at its upper or lower edge.
bool showsWholeGlyphs(const ToolkitLabel& label)
{
    const QRect ink = label.fontMetrics().tightBoundingRect(label.text()).translated(0, label.baseline());
    return ink.top() >= 0 && ink.bottom() < label.height();
}

/// What the top-level window of the real client looks like.
struct Window : QWidget {
    explicit Window(bool showRelease) : QWidget(nullptr, Qt::Tool | Qt::FramelessWindowHint)
    {
        setFixedWidth(300);
        panel = new InfoWidget(this, showRelease);
        auto* box = new QVBoxLayout(this);
        box->setSpacing(0);
        box->setContentsMargins(0, 0, 0, 0);
        box->addWidget(panel);
    }
    InfoWidget* panel;
};

} // namespace

class TestPanel : public QObject
{
    Q_OBJECT

private slots:
    void fieldsReachTheirRows();
    void longValues_data();
    void longValues();
    void mixedUpMarkup();
    void pagesSwitch();
    void sceneBox();
    void links_data();
    void links();
    void dateLines_data();
    void dateLines();
    void everythingFits_data();
    void everythingFits();
    void legibleOnDarkDesktop();
    void tabOrder();
};

void TestPanel::fieldsReachTheirRows()
{
    InfoWidget panel(nullptr, true);
    panel.setLoginInfo(loginInfo());
    panel.setNetInfo(netInfo());
    const QList<QPair<const char*, QString>> expected = {
        {"terminalValue", QStringLiteral("终端别名：办公终端")},
        {"nameValue", QStringLiteral("组织名称：数据中心")},
        {"macValue", QStringLiteral("人员姓名：王小明")},
        {"userRoleValue", QStringLiteral("工号：20190412")},
        {"departmentValue", QStringLiteral("部门：运维处")},
        {"hostValue", QStringLiteral("主机名：Ag-host")},
        {"ipv4Value", QStringLiteral("IPv4：192.168.1.9")},
        {"ipV4GatewayValue", QStringLiteral("网关：192.168.1.1")},
        {"dnsValeu", QStringLiteral("DNS：192.168.1.2")},
        {"subnetmaskValue", QStringLiteral("子网掩码：255.255.0.0")},
        {"netspeedValue", QStringLiteral("速率：1000 Mb/s")},
    };
    for (const auto& row : expected) {
        QVERIFY2(label(panel, row.first), row.first);
        QCOMPARE(label(panel, row.first)->accessibleName(), row.second);
        QCOMPARE(label(panel, row.first)->text(), row.second.section(QChar(0xff1a), 1));
    }
    const QString loginTime = label(panel, "loginValue")->text();
    const QDateTime shown = QDateTime::fromString(loginTime, QStringLiteral("yyyy-MM-dd hh:mm:ss"));
    QVERIFY2(qAbs(shown.secsTo(QDateTime::currentDateTime())) < 60, qPrintable(loginTime));
}

void TestPanel::longValues_data()
{
    QTest::addColumn<QString>("name");
    QTest::addColumn<bool>("elided");
    for (const char* name : {"terminalValue", "nameValue", "macValue", "userRoleValue", "departmentValue", "hostValue"})
        QTest::newRow(name) << QString::fromLatin1(name) << true;
    for (const char* name : {"ipv4Value", "ipV4GatewayValue", "dnsValeu", "subnetmaskValue", "netspeedValue"})
        QTest::newRow(name) << QString::fromLatin1(name) << false;
}

void TestPanel::longValues()
{
    QFETCH(QString, name);
    QFETCH(bool, elided);
    InfoWidget panel(nullptr, false);
    QLabel* value = panel.findChild<QLabel*>(name);
    panel.setLoginInfo({longName, longName, longName, longName, longName, longName});
    panel.setNetInfo({longName, longName, longName, longName, longName, longName, longName, longName});
    QVERIFY(value->accessibleName().endsWith(longName));
    if (!elided) {
        QCOMPARE(value->text(), longName);
        QCOMPARE(value->toolTip(), QString());
        return;
    }
    QVERIFY(value->text().size() < longName.size());
    QVERIFY(value->text().startsWith(longName.left(2)) && value->text().endsWith(longName.left(2)));
    QVERIFY(value->fontMetrics().horizontalAdvance(value->text()) <= 170);
    QCOMPARE(value->toolTip(), longName);

    panel.setLoginInfo(loginInfo());
    panel.setNetInfo(netInfo());
    QVERIFY(!value->text().contains(longName.left(1)) || value->text().size() < 5);
    QCOMPARE(value->toolTip(), longName);
}

void TestPanel::mixedUpMarkup()
{
    InfoWidget panel(nullptr, false);
    const QString text = QStringLiteral("<b>") + longName + QStringLiteral("</b>");
    TLoginInfo info = loginInfo();
    info.organizationName = text;
    info.personName = QStringLiteral("<i>x</i>");
    panel.setLoginInfo(info);
    QVERIFY(!label(panel, "nameValue")->toolTip().contains(QStringLiteral("<b>")));
    QVERIFY(label(panel, "nameValue")->toolTip().contains(QStringLiteral("&lt;b&gt;")));
    QCOMPARE(label(panel, "macValue")->text(), info.personName);
    for (const QLabel* shown : panel.findChildren<QLabel*>())
        QCOMPARE(shown->textFormat(), Qt::PlainText);
}

void TestPanel::pagesSwitch()
{
    Window window(false);
    window.show();
    auto* login = window.panel->findChild<QAbstractButton*>(QStringLiteral("LoginInfo"));
    auto* net = window.panel->findChild<QAbstractButton*>(QStringLiteral("NetInfo"));
    const auto shows = [&](const char* visible, const char* hidden) {
        return label(*window.panel, visible)->isVisible() && !label(*window.panel, hidden)->isVisible();
    };
    QVERIFY(login->isChecked() && shows("loginValue", "dnsValeu"));
    QTest::mouseClick(net, Qt::LeftButton);
    QVERIFY(net->isChecked() && shows("dnsValeu", "loginValue"));
    QTest::mouseClick(login, Qt::LeftButton);
    QVERIFY(shows("loginValue", "dnsValeu"));
    window.panel->onButtonClicked(net);
    QToolButton stranger;
    window.panel->onButtonClicked(&stranger);
    QVERIFY(shows("loginValue", "dnsValeu"));
}

void TestPanel::sceneBox()
{
    Window window(false);
    window.show();
    InfoWidget& panel = *window.panel;
    auto* box = panel.findChild<QComboBox*>();
    QVERIFY(!box->isVisible());
    QCOMPARE(panel.size(), QSize(300, 469));

    QSignalSpy changes(&panel, &InfoWidget::environmentChanegd);
    panel.setSceneBoxData({QStringLiteral("内网"), QStringLiteral("外网")});
    QCOMPARE(changes.count(), 1);
    QCOMPARE(panel.getCurrentScene(), QStringLiteral("内网"));
    panel.setCurrentScene(1);
    QCOMPARE(changes.count(), 2);
    QCOMPARE(panel.getCurrentScene(), QStringLiteral("外网"));
    panel.setSceneBoxData({QStringLiteral("专网")});
    QCOMPARE(box->count(), 3);
    QCOMPARE(changes.count(), 2);

    panel.setSceneBox(true);
    QCOMPARE(panel.height(), 515);
    QVERIFY(box->isVisible());
    auto* layout = qobject_cast<QVBoxLayout*>(panel.layout());
    QVERIFY(layout && layout->itemAt(7)->layout() && layout->itemAt(7)->layout()->indexOf(box) >= 0);
    panel.setSceneBox(false);
    QVERIFY(!box->isVisible());
    QCOMPARE(panel.height(), 469);
}

void TestPanel::links_data()
{
    QTest::addColumn<bool>("showRelease");
    QTest::newRow("with release") << true;
    QTest::newRow("without release") << false;
}

void TestPanel::links()
{
    QFETCH(bool, showRelease);
    InfoWidget panel(nullptr, showRelease);
    QSignalSpy password(&panel, &InfoWidget::modifyPasswordClicked);
    QSignalSpy removal(&panel, &InfoWidget::removeRegionClicked);
    auto* release = panel.findChild<QToolButton*>(QStringLiteral("closeGuard"));
    QCOMPARE(release != nullptr, showRelease);
    panel.findChild<QToolButton*>(QStringLiteral("changePassword"))->click();
    if (release)
        release->click();
    QCOMPARE(password.count(), 1);
    QCOMPARE(removal.count(), showRelease ? 1 : 0);
}

void TestPanel::dateLines_data()
{
    QTest::addColumn<QLocale>("locale");
    QTest::newRow("Chinese") << QLocale(QLocale::Chinese, QLocale::China);
    QTest::newRow("English") << QLocale(QLocale::English, QLocale::UnitedStates);
    QTest::newRow("Vietnamese") << QLocale(QLocale::Vietnamese, QLocale::Vietnam);
}

void TestPanel::dateLines()
{
    QFETCH(QLocale, locale);
    const QLocale before;
    QLocale::setDefault(locale);
    QDate today;
    InfoWidget panel(nullptr, false);
    do { // again if midnight came in between
        today = QDate::currentDate();
        panel.updateDateTimer();
    } while (today != QDate::currentDate());
    QLocale::setDefault(before);
    const QLabel* date = label(panel, "dateTimeLabel");
    const QString expected = QStringLiteral("%1年%2月%3日 %4")
                                 .arg(today.year(), 4, 10, QLatin1Char('0'))
                                 .arg(today.month(), 2, 10, QLatin1Char('0'))
                                 .arg(today.day(), 2, 10, QLatin1Char('0'))
                                 .arg(locale.dayName(today.dayOfWeek()));
    QCOMPARE(date->text(), expected);
    QVERIFY(date->fontMetrics().horizontalAdvance(date->text()) <= date->width());
    const QString lunar = label(panel, "CdateTimeLabel")->text();
    QVERIFY2(QRegularExpression(QStringLiteral("^..年闰?.{1,2}月..$")).match(lunar).hasMatch(), qPrintable(lunar));
}

void TestPanel::everythingFits_data()
{
    QTest::addColumn<bool>("showRelease");
    QTest::addColumn<bool>("scenes");
    QTest::addColumn<bool>("network");
    for (int row = 0; row < 8; ++row)
        QTest::addRow("release %d, scenes %d, network %d", row & 1, row >> 1 & 1, row >> 2 & 1)
            << bool(row & 1) << bool(row & 2) << bool(row & 4);
}

void TestPanel::everythingFits()
{
    QFETCH(bool, showRelease);
    QFETCH(bool, scenes);
    QFETCH(bool, network);
    Window window(showRelease);
    window.panel->setLoginInfo({longName, longName, longName, longName, longName, longName});
    window.panel->setNetInfo(netInfo());
    if (scenes) {
        window.panel->setSceneBoxData({longName});
        window.panel->setSceneBox(true);
    }
    if (network)
        window.panel->findChild<QAbstractButton*>(QStringLiteral("NetInfo"))->click();
    window.show();
    QVERIFY(QTest::qWaitForWindowExposed(&window));
    QCOMPARE(window.size(), QSize(300, scenes ? 515 : 469));

    QList<QWidget*> leaves;
    const QList<QWidget*> children = window.panel->findChildren<QWidget*>();
    for (QWidget* child : children) {
        if (child->isVisible() && child->findChildren<QWidget*>().isEmpty())
            leaves.append(child);
    }
    QVERIFY(leaves.size() >= 17);
    for (int i = 0; i < leaves.size(); ++i) {
        QWidget* leaf = leaves[i];
        // Clipped by no ancestor, so wholly visible.
        QVERIFY2(leaf->visibleRegion() == QRegion(leaf->rect()), qPrintable(leaf->objectName()));
        for (int j = 0; j < i; ++j) {
            const QRect one(leaf->mapTo(&window, QPoint()), leaf->size());
            const QRect other(leaves[j]->mapTo(&window, QPoint()), leaves[j]->size());
            QVERIFY2(!one.intersects(other), qPrintable(leaf->objectName() + ' ' + leaves[j]->objectName()));
        }
        QString text;
        if (auto* shown = qobject_cast<ToolkitLabel*>(leaf)) {
            text = shown->text();
            QVERIFY2(showsWholeGlyphs(*shown), qPrintable(text));
        } else if (auto* button = qobject_cast<QAbstractButton*>(leaf)) {
            text = button->text();
        }
        QVERIFY2(leaf->fontMetrics().horizontalAdvance(text) <= leaf->width(), qPrintable(text));
    }
}

void TestPanel::legibleOnDarkDesktop()
{
    const QPalette before = QApplication::palette();
    QApplication::setPalette(ThemeHelper::palette(ThemeHelper::DarkType));
    Window window(true);
    QStringList dark;
    const QList<QWidget*> children = window.panel->findChildren<QWidget*>();
    for (const QWidget* child : children) {
        const QPalette palette = child->palette();
        if (palette.color(QPalette::Window).lightness() < 200 || palette.color(QPalette::Base).lightness() < 200 ||
            palette.color(QPalette::Text).lightness() > 60)
            dark.append(child->objectName());
    }
    QApplication::setPalette(before);
    QVERIFY2(dark.isEmpty(), qPrintable(dark.join(QLatin1Char(' '))));
}

void TestPanel::tabOrder()
{
    Window window(true);
    window.panel->setSceneBoxData({QStringLiteral("内网")});
    window.panel->setSceneBox(true);
    window.show();
    QVERIFY(QTest::qWaitForWindowActive(&window));
    QStringList visited;
    for (int i = 0; i < 5; ++i) {
        QWidget* focused = QApplication::focusWidget();
        visited.append(qobject_cast<QComboBox*>(focused) ? QStringLiteral("scenes") : focused->objectName());
        QTest::keyClick(&window, Qt::Key_Tab);
    }
    const QStringList expected = {QStringLiteral("LoginInfo"), QStringLiteral("scenes"), QStringLiteral("onTop"),
                                  QStringLiteral("closeGuard"), QStringLiteral("changePassword")};
    QCOMPARE(visited, expected);
}

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestPanel test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_panel.moc"

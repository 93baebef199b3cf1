// The information panel: what it shows, what it reports, and that everything fits.

#include "infowidget.h"
#include "themehelper.h"
#include "toolkitapplication.h"
#include "toolkitlabel.h"

#include <QComboBox>
#include <QLabel>
#include <QSignalSpy>
#include <QToolButton>
#include <QVBoxLayout>
#include <QtTest>

namespace
{

const QString longName = QString(60, QChar(0x7ec4)); // 组
const TLoginInfo loginInfo = {"办公终端", "数据中心", "王小明", "20190412", "spare", "运维处"};
const TNetInfo netInfo = {"Ag-host",     "(gypsy)",     "52:54:00:ab:cd:ef", "192.168.1.9",
                          "192.168.1.1", "192.168.1.2", "255.255.0.0",       "1000 Mb/s"};

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
    QLabel* label(const char* name) const { return panel->findChild<QLabel*>(name); }
    QAbstractButton* button(const char* name) const { return panel->findChild<QAbstractButton*>(name); }

    InfoWidget* panel;
};

} // namespace

class TestPanel : public QObject
{
    Q_OBJECT

    static void checkFit(bool showRelease, bool scenes, bool network)
    {
        Window window(showRelease);
        window.panel->setLoginInfo({longName, longName, longName, longName, longName, longName});
        window.panel->setNetInfo(netInfo);
        if (scenes) {
            window.panel->setSceneBoxData({longName});
            window.panel->setSceneBox(true);
        }
        if (network)
            window.button("NetInfo")->click();
        window.show();
        QVERIFY(QTest::qWaitForWindowExposed(&window));
        QCOMPARE(window.size(), QSize(300, scenes ? 515 : 469));

        QRegion covered;
        int leaves = 0;
        for (QWidget* leaf : window.panel->findChildren<QWidget*>()) {
            if (!leaf->isVisible() || !leaf->findChildren<QWidget*>().isEmpty())
                continue;
            ++leaves;
            const QRect place(leaf->mapTo(&window, QPoint()), leaf->size());
            QVERIFY2(leaf->visibleRegion() == QRegion(leaf->rect()), qPrintable(leaf->objectName() + " is clipped"));
            QVERIFY2(!covered.intersects(place), qPrintable(leaf->objectName() + " overlaps"));
            covered += place;
            const QString text = leaf->property("text").toString();
            QVERIFY2(leaf->fontMetrics().horizontalAdvance(text) <= leaf->width(), qPrintable(text));
            if (auto* label = qobject_cast<ToolkitLabel*>(leaf)) {
                const QRect ink = label->fontMetrics().tightBoundingRect(text).translated(0, label->baseline());
                QVERIFY2(ink.top() >= 0 && ink.bottom() < label->height(), qPrintable(text + " is cut"));
            }
        }
        QVERIFY(leaves >= 17);
    }

private slots:
    void fieldsReachTheirRows()
    {
        Window window(true);
        window.panel->setLoginInfo(loginInfo);
        window.panel->setNetInfo(netInfo);
        const QList<QPair<const char*, QString>> expected = {
            {"terminalValue", "终端别名：办公终端"}, {"nameValue", "组织名称：数据中心"},
            {"macValue", "人员姓名：王小明"},        {"userRoleValue", "工号：20190412"},
            {"departmentValue", "部门：运维处"},     {"hostValue", "主机名：Ag-host"},
            {"ipv4Value", "IPv4：192.168.1.9"},      {"ipV4GatewayValue", "网关：192.168.1.1"},
            {"dnsValeu", "DNS：192.168.1.2"},        {"subnetmaskValue", "子网掩码：255.255.0.0"},
            {"netspeedValue", "速率：1000 Mb/s"},
        };
        for (const auto& [name, text] : expected) {
            QVERIFY2(window.label(name), name);
            QCOMPARE(window.label(name)->accessibleName(), text);
            QCOMPARE(window.label(name)->text(), text.section("：", 1));
        }
        const QDateTime shown = QDateTime::fromString(window.label("loginValue")->text(), "yyyy-MM-dd hh:mm:ss");
        QVERIFY(qAbs(shown.secsTo(QDateTime::currentDateTime())) < 60);
    }

    void longValues()
    {
        Window window(false);
        window.panel->setLoginInfo({longName, longName, longName, longName, longName, longName});
        window.panel->setNetInfo({longName, longName, longName, longName, longName, longName, longName, longName});
        const QStringList elided = {"terminalValue", "nameValue",       "macValue",
                                    "userRoleValue", "departmentValue", "hostValue"};
        for (const QString& name : elided) {
            const QLabel* value = window.panel->findChild<QLabel*>(name);
            QVERIFY(value->accessibleName().endsWith(longName));
            QVERIFY(value->text().startsWith(longName.left(2)) && value->text().endsWith(longName.left(2)));
            QVERIFY(value->fontMetrics().horizontalAdvance(value->text()) <= 170);
            QCOMPARE(value->toolTip(), longName);
        }
        for (const char* name : {"ipv4Value", "ipV4GatewayValue", "dnsValeu", "subnetmaskValue", "netspeedValue"})
            QCOMPARE(window.label(name)->text() + window.label(name)->toolTip(), longName);
        // The tool tip of an earlier long value stays.
        window.panel->setLoginInfo(loginInfo);
        QCOMPARE(window.label("nameValue")->text(), loginInfo.organizationName);
        QCOMPARE(window.label("nameValue")->toolTip(), longName);
    }

    void markupIsShownAsText()
    {
        Window window(false);
        TLoginInfo info = loginInfo;
        info.organizationName = "<b>" + longName + "</b>";
        info.personName = "<i>x</i>";
        window.panel->setLoginInfo(info);
        QVERIFY(window.label("nameValue")->toolTip().contains("&lt;b&gt;"));
        QCOMPARE(window.label("macValue")->text(), info.personName);
        for (const QLabel* shown : window.panel->findChildren<QLabel*>())
            QCOMPARE(shown->textFormat(), Qt::PlainText);
    }

    void pagesSwitch()
    {
        Window window(false);
        window.show();
        const auto shownPage = [&] {
            return QString(window.label("loginValue")->isVisible() ? "login" : "") +
                   (window.label("dnsValeu")->isVisible() ? "network" : "");
        };
        QCOMPARE(shownPage(), QString("login"));
        QTest::mouseClick(window.button("NetInfo"), Qt::LeftButton);
        QCOMPARE(shownPage(), QString("network"));
        QTest::mouseClick(window.button("LoginInfo"), Qt::LeftButton);
        QCOMPARE(shownPage(), QString("login"));
        window.panel->onButtonClicked(window.button("NetInfo"));
        QToolButton stranger;
        window.panel->onButtonClicked(&stranger);
        QCOMPARE(shownPage(), QString("login"));
    }

    void sceneBox()
    {
        Window window(false);
        window.show();
        InfoWidget& panel = *window.panel;
        const auto* box = panel.findChild<QComboBox*>();
        QSignalSpy changes(&panel, &InfoWidget::environmentChanegd);
        panel.setSceneBoxData({"内网", "外网"});
        QCOMPARE(changes.count(), 1);
        QCOMPARE(panel.getCurrentScene(), QString("内网"));
        panel.setCurrentScene(1);
        panel.setSceneBoxData({"专网"});
        QCOMPARE(changes.count(), 2);
        QCOMPARE(panel.getCurrentScene(), QString("外网"));
        QCOMPARE(box->count(), 3);
        for (const bool shown : {true, false}) {
            panel.setSceneBox(shown);
            QCOMPARE(box->isVisible(), shown);
            QCOMPARE(panel.size(), QSize(300, shown ? 515 : 469));
        }
    }

    void dateLines()
    {
        // A locale with long names of days.
        const QLocale locale(QLocale::Vietnamese);
        QLocale::setDefault(locale);
        Window window(false);
        QDate today;
        do { // again if midnight came in between
            today = QDate::currentDate();
            window.panel->updateDateTimer();
        } while (today != QDate::currentDate());
        QLocale::setDefault(QLocale::system());
        const QLabel* date = window.label("dateTimeLabel");
        QCOMPARE(date->text(), today.toString("yyyy年MM月dd日 ") + locale.dayName(today.dayOfWeek()));
        QVERIFY(date->fontMetrics().horizontalAdvance(date->text()) <= date->width());
        const QString lunar = window.label("CdateTimeLabel")->text();
        QVERIFY2(QRegularExpression("^..年闰?.{1,2}月..$").match(lunar).hasMatch(), qPrintable(lunar));
    }

    void everythingFits()
    {
        for (int i = 0; i < 8 && !QTest::currentTestFailed(); ++i)
            checkFit(i & 1, i & 2, i & 4);
    }

    void legibleOnDarkDesktop()
    {
        const QPalette before = QApplication::palette();
        QApplication::setPalette(ThemeHelper::palette(ThemeHelper::DarkType));
        Window window(true);
        QStringList dark;
        for (const QWidget* child : window.panel->findChildren<QWidget*>()) {
            const auto lightness = [child](QPalette::ColorRole role) {
                return child->palette().color(role).lightness();
            };
            // The check box shows this colour only as its frame.
            const bool frameOnly = child->objectName() == "onTop";
            if ((!frameOnly && lightness(QPalette::Window) < 200) || lightness(QPalette::Base) < 200 ||
                lightness(QPalette::Text) > 60)
                dark.append(child->objectName());
        }
        QApplication::setPalette(before);
        QCOMPARE(dark, QStringList());
    }

    void linksAndTabOrder()
    {
        QVERIFY(!Window(false).button("closeGuard"));
        Window window(true);
        QSignalSpy password(window.panel, &InfoWidget::modifyPasswordClicked);
        QSignalSpy removal(window.panel, &InfoWidget::removeRegionClicked);
        window.button("changePassword")->click();
        QCOMPARE(QList<int>({password.count(), removal.count()}), QList<int>({1, 0}));
        window.button("closeGuard")->click();
        QCOMPARE(QList<int>({password.count(), removal.count()}), QList<int>({1, 1}));

        window.panel->setSceneBox(true);
        window.show();
        QVERIFY(QTest::qWaitForWindowActive(&window));
        QStringList visited;
        for (int i = 0; i < 5; ++i) {
            visited.append(qobject_cast<QComboBox*>(QApplication::focusWidget())
                               ? "scenes"
                               : QApplication::focusWidget()->objectName());
            QTest::keyClick(&window, Qt::Key_Tab);
        }
        QCOMPARE(visited, QStringList({"LoginInfo", "scenes", "onTop", "closeGuard", "changePassword"}));
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestPanel test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_panel.moc"

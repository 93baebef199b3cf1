// SPDX-License-Identifier: Apache-2.0
#include "infowidget.h"
#include "toolkitapplication.h"

#include <QAbstractButton>
#include <QLabel>
#include <QtTest>

class TestPanel : public QObject
{
    Q_OBJECT

private slots:
    void longValues()
    {
        const QString longName = QString(60, QChar(0x7ec4)); // 组
        InfoWidget panel(nullptr, false);
        panel.setLoginInfo({longName, longName, longName, longName, longName, longName});
        panel.setNetInfo({longName, longName, longName, longName, longName, longName, longName, longName});
        for (const char* name :
             {"terminalValue", "nameValue", "macValue", "userRoleValue", "departmentValue", "hostValue"}) {
            const auto* value = panel.findChild<QLabel*>(name);
            QVERIFY(value->accessibleName().endsWith(longName));
            QVERIFY(value->text().startsWith(longName.left(2)) && value->text().endsWith(longName.left(2)));
            QVERIFY(value->fontMetrics().horizontalAdvance(value->text()) <= 170);
            QCOMPARE(value->toolTip(), longName);
        }
        // The tool tip of an earlier long value stays.
        panel.setLoginInfo({"a", "b", "c", "d", "e", "f"});
        QCOMPARE(panel.findChild<QLabel*>("nameValue")->toolTip(), longName);
        panel.setNetInfo({"1", "2", "3", "4", "5", "6", "7", "8"});
        QStringList shown;
        for (const QLabel* label : panel.findChildren<QLabel*>()) {
            if (label->text().size() == 1)
                shown.append(label->objectName() + ' ' + label->text());
        }
        QCOMPARE(shown, QStringList({"terminalValue a", "nameValue b", "macValue c", "userRoleValue d",
                                     "departmentValue f", "hostValue 1", "nameValue 2", "macValue 3", "ipv4Value 4",
                                     "ipV4GatewayValue 5", "dnsValeu 6", "subnetmaskValue 7", "netspeedValue 8"}));
    }

    void aPageAtATime()
    {
        InfoWidget panel(nullptr, false);
        for (const bool network : {true, false, true}) {
            panel.findChild<QAbstractButton*>(network ? "NetInfo" : "LoginInfo")->click();
            QCOMPARE(panel.findChild<QLabel*>("dnsValeu")->isVisibleTo(&panel), network);
            QCOMPARE(panel.findChild<QLabel*>("loginValue")->isVisibleTo(&panel), !network);
        }
        // Markup is shown as text.
        panel.setLoginInfo({"", "<img src='http://example.invalid/x.png'>" + QString(60, 'x'), "<i>x</i>", "", "", ""});
        QVERIFY(panel.findChild<QLabel*>("nameValue")->toolTip().contains("&lt;img src="));
        QCOMPARE(panel.findChild<QLabel*>("macValue")->text(), QString("<i>x</i>"));
        for (const QLabel* shown : panel.findChildren<QLabel*>())
            QCOMPARE(shown->textFormat(), Qt::PlainText);
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestPanel test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_panel.moc"

// SPDX-License-Identifier: Apache-2.0
#include "logcapture.h"
#include "mainwindow.h"
#include "notify.h"
#include "sessionhost.h"
#include "sizedicon.h"
#include "toolkittitlebar.h"
#include "trayclicks.h"
#include "trayhost.h"
#include "trayicon.h"
#include "trayregistry.h"

#include <QRegularExpression>
#include <QSignalSpy>
#include <QtTest>

/// The window's icon: what its clicks do, and when there is one.
class TestTray : public QObject
{
    Q_OBJECT

    std::unique_ptr<MainWindow> m_window;

    void makeWindow() { m_window = std::make_unique<MainWindow>(nullptr, 1029); }

private slots:
    void init() { makeWindow(); }
    void cleanup() { m_window.reset(); }

    void clicksOnTheIcon()
    {
        using Tray = QSystemTrayIcon;
        auto* icon = m_window->findChild<TrayIcon*>();
        const QPoint corner = m_window->pos();
        m_window->move(-50, 10);
        const std::pair<Tray::ActivationReason, bool> clicks[] = {
            {Tray::Trigger, false}, {Tray::Trigger, true},      {Tray::Context, true},
            {Tray::Trigger, true},  {Tray::Unknown, true},      {Tray::DoubleClick, true},
            {Tray::Trigger, false}, {Tray::MiddleClick, false}, {Tray::Trigger, true}};
        for (const auto& [reason, shown] : clicks) {
            emit icon->activated(reason);
            QVERIFY2(m_window->isVisible() == shown, qPrintable(QString("click %1").arg(reason)));
        }
        QCOMPARE(m_window->pos(), corner);
        QTRY_VERIFY(m_window->hasFocus());
        m_window->close();
        QVERIFY(m_window->isHidden());
        emit m_window->findChild<ToolkitTitlebar*>()->windowDragged();
        m_window->move(-50, 10);
        emit icon->activated(Tray::Trigger);
        QVERIFY(m_window->isVisible());
        QCOMPARE(m_window->pos(), QPoint(-50, 10));

        // Of a host that reports every click as one of its own.
        QList<int> meant;
        TrayClicks single;
        for (const auto reason : {Tray::Trigger, Tray::Trigger, Tray::Trigger, Tray::MiddleClick, Tray::Trigger})
            single.pass(Tray(), reason, [&](auto meaning) { meant.append(meaning); });
        QCOMPARE(meant, QList<int>({3, 2, 3, 4, 3}));
    }

    void shutdownEndsTheWaitForATray()
    {
        m_window->setSysThemetype(2);
        for (const bool ended : {true, false}) {
            makeWindow();
            const SessionHost host(*m_window);
            m_window->show();
            if (ended)
                m_window->shutdown();
            QCOMPARE(m_window->isHidden(), ended);
            const TrayHostWatch witness;
            QSignalSpy appeared(&witness, &TrayHostWatch::hostAppeared);
            const LogCapture log;
            const TrayRegistry registry;
            QTRY_COMPARE(appeared.count(), 1);
            QVERIFY(log.records().contains("info TrayHostWatch a tray host is there"));
            QCOMPARE(m_window->findChild<QSystemTrayIcon*>() != nullptr, !ended);
            // Of a tray that shows no balloons, or of none.
            emit host.findChild<Notification*>()->onMessage(1, "", "title", "text", "sender");
            QTRY_VERIFY(log.records().contains(
                "warning SessionHost neither a notification service nor a tray shows the message"));
        }
        const auto* icon = m_window->findChild<QSystemTrayIcon*>();
        QCOMPARE(icon->toolTip(), QStringLiteral("终端域管平台"));
        const QList<QSize> sizes{{16, 16}, {22, 22}, {24, 24}, {32, 32}, {48, 48}, {64, 64}};
        QCOMPARE(icon->icon().availableSizes(), sizes);
        const char* const files[] = {"finalogo", "tarn", "tarn_dark"};
        for (int theme = 0; theme <= 2; ++theme) {
            if (theme > 0)
                m_window->setSysThemetype(theme);
            const QImage drawn = zent::sizedIcon(QString(":/images/%1.svg").arg(files[theme])).pixmap(64).toImage();
            QVERIFY2(!drawn.isNull() && icon->icon().pixmap(64).toImage() == drawn, files[theme]);
        }
        QVERIFY(icon->isVisible());
        m_window->shutdown();
        QVERIFY(!icon->isVisible());
    }
};

QTEST_MAIN(TestTray)
#include "test_tray.moc"

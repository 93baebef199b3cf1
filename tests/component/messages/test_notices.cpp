// SPDX-License-Identifier: Apache-2.0
#include "description.h"
#include "trayicon.h"
#include "windowtest.h"

/// The message dialog as the window opens it, with the notification service behind.
class TestNotices : public WindowTest
{
    Q_OBJECT

    const QString m_listPath = QStringLiteral("/notification/v2/list");

    QPushButton* first() const { return notice()->firstButton(); }
    QPushButton* next() const { return notice()->nextButton(); }
    QList<QPlainTextEdit*> views() const { return notice()->findChildren<QPlainTextEdit*>(); }
    void openNotice(int unread)
    {
        makeWindow(unread);
        // The polls' requests would be counted with those of the dialog.
        for (QTimer* poll : m_window->findChildren<QTimer*>())
            poll->stop();
        m_window->openNotice();
        QTRY_VERIFY(notice()->isVisible());
    }

private slots:
    void init() { startAnew(); }
    void cleanup() { m_window.reset(); }

    void noticeShowsTheNewestMessageAndRefreshes_data() { fixture::addRows("noticedialog.json"); }
    void noticeShowsTheNewestMessageAndRefreshes()
    {
        QFETCH(QJsonObject, row);
        makeWindow(row["unread"].toInt());
        const LogCapture log;
        // The dialog's wait gathers what comes meanwhile into one question.
        for (int i = 0; i < 50; ++i)
            QMetaObject::invokeMethod(m_window->findChild<TrayIcon*>(), &TrayIcon::balloonClicked,
                                      Qt::QueuedConnection);
        QTRY_VERIFY(notice()->isVisible());
        QCOMPARE(log.count("showNotice"), 50);
        fixture::compareLines(log.records().filter("noticeDialog::"), row["log"]);
        description::compare(notice(), row["widgets"]);
        const auto* frame = notice()->findChild<QWidget*>("informationWidget");
        QCOMPARE(frame->findChildren<QLabel*>().value(1)->text(),
                 QNotification::formatTime(row["time"].toString(), true));
        QCOMPARE(frame->layout()->indexOf(views()[0]), 0);
        QCOMPARE(frame->layout()->indexOf(views()[1]), frame->layout()->count() - 2);
        // A refresh leaves the focus where it is.
        views()[0]->setFocus();
        m_platform.addFault({{"path", m_listPath}}, row["reply"].toObject());
        m_window->openNotice();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        fixture::compare(QJsonArray{first()->text(), next()->isVisible()}, row["buttons"]);
        for (QWidget* inTabOrder : QWidgetList{views()[0], views()[1], first()}) {
            QCOMPARE(notice()->focusWidget(), inTabOrder);
            QTest::keyClick(inTabOrder, Qt::Key_Tab);
        }
        QVERIFY(next()->isHidden() || notice()->focusWidget() == next());
        first()->click();
        const int marked = row["marked"].toInt();
        QCOMPARE(notice()->isHidden(), marked == 0);
        QTRY_COMPARE(m_platform.requests("/notification/v2/read").size(), marked);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QCOMPARE(m_boxes.texts, QStringList());
    }

    void oneMessageIsMarkedReadOnce()
    {
        openNotice(1);
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        m_platform.addFault({{"path", "*/read"}}, {{"status", 500}});
        first()->click();
        QTRY_COMPARE(m_boxes.texts.size(), 1);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(read.isEmpty());
        startAnew();
        first()->click();
        first()->click();
        QTRY_COMPARE(read, QList<QVariantList>{{"0"}});
        QCOMPARE(m_platform.requests("/notification/v2/read").size(), 1);
        QTRY_COMPARE(first()->text(), QStringLiteral("关闭"));
        QTRY_VERIFY(!first()->signalsBlocked());
        first()->click();
        // What is read elsewhere refreshes an open dialog only, also one behind another window.
        for (const bool open : {false, true}) {
            QVERIFY(notice()->isHidden());
            notice()->setVisible(open);
            m_window->show();
            m_window->activateWindow();
            m_platform.clearRecord();
            m_window->onReadAllMessage();
            QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
            QCOMPARE(m_platform.requests(m_listPath).size(), open ? 1 : 0);
        }
    }

    void severalMessagesAreSteppedThrough()
    {
        openNotice(3);
        QCOMPARE(notice()->focusWidget(), views().last());
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        next()->setFocus();
        next()->click();
        QVERIFY(!next()->isEnabled());
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(2)"));
        QCOMPARE(read, QList<QVariantList>{{"2"}});
        QVERIFY(next()->isEnabled());
        QCOMPARE(notice()->focusWidget(), views().last());
        QCOMPARE(views()[0]->toPlainText(), QStringLiteral("<i>通知</i> 1 %2"));

        m_platform.addFault({{"path", "/notification/v2/*"}}, {{"status", 500}});
        const LogCapture log;
        bool logged = false;
        m_boxes.instead = [&logged, &log] {
            logged = log.contains("/read\" failed: status 500");
            QApplication::activeModalWidget()->close();
        };
        // The request is under way when this returns.
        m_window->openNotice();
        next()->click();
        QTRY_COMPARE(m_boxes.texts.size(), 1);
        QVERIFY2(m_boxes.texts[0].startsWith("消息调用警告Error"), qPrintable(m_boxes.texts[0]));
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(logged && read.size() == 1 && !next()->isEnabled());
        QCOMPARE(views()[0]->toPlainText(), QStringLiteral("<i>通知</i> 1 %2"));
        m_platform.clearFaults();
        m_window->onReadListMessage("other");
        QTRY_VERIFY(next()->isEnabled());
    }
};

QTEST_MAIN(TestNotices)
#include "test_notices.moc"

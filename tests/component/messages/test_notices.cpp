// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "fixture.h"
#include "mainwindow.h"
#include "noticedialog.h"
#include "notification.h"
#include "platformcontrol.h"
#include "trayicon.h"

#include <QLabel>
#include <QLayout>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QSignalSpy>
#include <QTimer>

/// The message dialog as the window opens it, with the notification service behind.
class TestNotices : public QObject
{
    Q_OBJECT

    const QString m_listPath = QStringLiteral("/notification/v2/list");
    PlatformControl m_platform;
    std::unique_ptr<MainWindow> m_window;

    NoticeDialog* notice() const { return m_window->findChild<NoticeDialog*>(); }
    QPushButton* first() const { return notice()->firstButton(); }
    QPushButton* next() const { return notice()->nextButton(); }
    QString shownTitle() const { return notice()->findChild<QPlainTextEdit*>()->toPlainText(); }
    /// The texts of the message dialog, with what else each view and button is.
    QJsonArray noticeContent(const QString& time) const
    {
        QJsonArray content;
        for (const QLabel* label : notice()->findChildren<QLabel*>()) {
            if (!label->text().isEmpty())
                content.append(label->text().replace(QNotification::formatTime(time, true), "TIME"));
        }
        for (const QPlainTextEdit* view : notice()->findChildren<QPlainTextEdit*>()) {
            QStringList words{view->toPlainText()};
            for (const char* property : {"objectName", "accessibleName", "readOnly", "tabChangesFocus", "frameShape",
                                         "verticalScrollBarPolicy", "horizontalScrollBarPolicy", "height"})
                words.append(view->property(property).toString());
            for (const int number : {view->font().pixelSize(), view->font().weight(), int(view->wordWrapMode()),
                                     int(view->viewport()->autoFillBackground())})
                words.append(QString::number(number));
            content.append(words.join(' '));
        }
        for (const QPushButton* button : {first(), next()})
            content.append(button->isVisible() ? button->text() + QString(" %1").arg(button->width()) : "hidden");
        return content;
    }
    void makeWindow(int unread)
    {
        m_platform.setUnread(unread);
        MainWindow::unreadMessageCount = 0;
        m_window = std::make_unique<MainWindow>(nullptr, 1029);
    }
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
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
    }
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
        fixture::compare(QJsonArray::fromStringList(log.records().filter("noticeDialog::")), row["log"]);
        QVERIFY(notice()->windowFlags().testFlag(Qt::WindowStaysOnTopHint));
        const auto views = notice()->findChildren<QPlainTextEdit*>();
        QCOMPARE(notice()->focusWidget(), views.last());
        fixture::compare(noticeContent(row["time"].toString()), row["shown"]);
        const QLayout* layout = notice()->findChild<QWidget*>("informationWidget")->layout();
        QCOMPARE(layout->indexOf(views[0]), 0);
        QCOMPARE(layout->indexOf(views[1]), layout->count() - 2);
        // A refresh leaves the focus where it is.
        views[0]->setFocus();
        m_platform.addFault({{"path", m_listPath}}, row["reply"].toObject());
        m_window->openNotice();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        fixture::compare(first()->text(), row["text"]);
        fixture::compare(next()->isVisible(), row["next"]);
        for (QWidget* inTabOrder : QWidgetList{views[0], views[1], first()}) {
            QCOMPARE(notice()->focusWidget(), inTabOrder);
            QTest::keyClick(inTabOrder, Qt::Key_Tab);
        }
        QVERIFY(next()->isHidden() || notice()->focusWidget() == next());
        first()->click();
        const int marked = row["marked"].toInt();
        QCOMPARE(notice()->isHidden(), marked == 0);
        QTRY_COMPARE(m_platform.requests("/notification/v2/read").size(), marked);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
    }

    void oneMessageIsMarkedReadOnce()
    {
        openNotice(1);
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        BoxCloser boxes;
        m_platform.addFault({{"path", "*/read"}}, {{"status", 500}});
        first()->click();
        QTRY_COMPARE(boxes.texts.size(), 1);
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(read.isEmpty());
        m_platform.clearFaults();
        m_platform.clearRecord();
        first()->click();
        first()->click();
        QTRY_COMPARE(read, QList<QVariantList>{{"0"}});
        QCOMPARE(m_platform.requests("/notification/v2/read").size(), 1);
        QTRY_COMPARE(first()->text(), QStringLiteral("关闭"));
        QTRY_VERIFY(!first()->signalsBlocked());
        first()->click();
        QVERIFY(notice()->isHidden());
        // What is read elsewhere refreshes an open dialog only, also one behind another window.
        for (const bool open : {false, true}) {
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
        QCOMPARE(next()->text(), QStringLiteral("下一条(3)"));
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        next()->click();
        QVERIFY(!next()->isEnabled());
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(2)"));
        QCOMPARE(read, QList<QVariantList>{{"2"}});
        QVERIFY(next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));

        m_platform.addFault({{"path", "/notification/v2/*"}}, {{"status", 500}});
        BoxCloser boxes;
        const LogCapture log;
        bool logged = false;
        boxes.instead = [&logged, &log] {
            logged = log.contains("/read\" failed: status 500");
            QApplication::activeModalWidget()->close();
        };
        // The request is under way when this returns.
        m_window->openNotice();
        next()->click();
        QTRY_COMPARE(boxes.texts.size(), 1);
        QVERIFY2(boxes.texts.constFirst().startsWith("消息调用警告Error"), qPrintable(boxes.texts.constFirst()));
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QVERIFY(logged && read.size() == 1 && !next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
        m_platform.clearFaults();
        m_window->onReadListMessage("other");
        QTRY_VERIFY(next()->isEnabled());
    }
};

QTEST_MAIN(TestNotices)
#include "test_notices.moc"

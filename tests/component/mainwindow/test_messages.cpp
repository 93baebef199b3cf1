#include "mainwindow.h"
#include "noticedialog.h"
#include "notification.h"
#include "platformcontrol.h"

#include <QApplication>
#include <QMessageBox>
#include <QPlainTextEdit>
#include <QPushButton>
#include <QSignalSpy>
#include <QtTest>

namespace
{

const QString kListPath = QStringLiteral("/notification/v2/list");
const QString kReadPath = QStringLiteral("/notification/v2/read");

} // namespace

class TestMessages : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    std::unique_ptr<MainWindow> m_window;

    NoticeDialog* notice() const { return m_window->findChild<NoticeDialog*>(); }
    QPushButton* first() const { return notice()->firstButton(); }
    QPushButton* next() const { return notice()->nextButton(); }
    QString shownTitle() const { return notice()->findChildren<QPlainTextEdit*>().first()->toPlainText(); }
    int requests(const QString& path)
    {
        int count = 0;
        for (const QJsonObject& request : m_platform.record("http"))
            count += request.value("path") == path ? 1 : 0;
        return count;
    }
    void makeWindow(int unread)
    {
        m_platform.setUnread(unread);
        MainWindow::unreadMessageCount = 0;
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
    }
    void openNotice()
    {
        m_window->openNotice();
        QTRY_VERIFY(notice()->isVisible());
    }
    /// Closes the warning box that comes next and keeps its texts.
    void expectWarning(QStringList& texts)
    {
        QTimer::singleShot(10, this, [this, &texts] {
            auto* box = qobject_cast<QMessageBox*>(QApplication::activeModalWidget());
            if (!box)
                return expectWarning(texts);
            texts = QStringList({box->windowTitle(), box->text()});
            box->button(QMessageBox::Ok)->click();
        });
    }

private slots:
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
    }
    void cleanup() { m_window.reset(); }

    void countIsAnnouncedOncePerChange()
    {
        makeWindow(150);
        QTRY_COMPARE(MainWindow::unreadMessageCount, 150);
        QSignalSpy spy(m_window.get(), &MainWindow::newMessage);
        m_platform.setUnread(2);
        const auto poll = [this] {
            // A new second: polls within one second share their URL and thus their callback.
            const QString second = QTime::currentTime().toString();
            QTRY_VERIFY(QTime::currentTime().toString() != second);
            m_window->unreadMessages();
            QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        };
        poll();
        QCOMPARE(spy.count(), 1);
        poll();
        m_platform.addFault({{"path", kListPath}}, {{"status", 500}});
        poll();
        QCOMPARE(spy.count(), 1);
        QCOMPARE(MainWindow::unreadMessageCount, 2);
    }

    void readingLowersTheCount()
    {
        makeWindow(0);
        MainWindow::unreadMessageCount = 1;
        for (int i = 0; i < 2; ++i) {
            m_window->onReadListMessage("x");
            QCOMPARE(MainWindow::unreadMessageCount, 0);
        }
        MainWindow::unreadMessageCount = 9;
        m_window->onReadAllMessage();
        QCOMPARE(MainWindow::unreadMessageCount, 0);
        QVERIFY(notice()->isHidden());
    }

    void oneMessageIsMarkedReadByTheWideButton()
    {
        makeWindow(1);
        QVERIFY(notice()->windowFlags().testFlag(Qt::WindowStaysOnTopHint));
        QVERIFY(notice()->windowFlags().testFlag(Qt::FramelessWindowHint));
        openNotice();
        QCOMPARE(first()->text(), QStringLiteral("已读"));
        QCOMPARE(first()->width(), 390);
        QVERIFY(next()->isHidden());

        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        first()->click();
        first()->click();
        QTRY_COMPARE(first()->text(), QStringLiteral("关闭"));
        QTRY_COMPARE(read.count(), 1);
        QCOMPARE(read.first().first().toString(), QStringLiteral("0"));
        QCOMPARE(requests(kReadPath), 1);
        QVERIFY(notice()->isVisible());
        QTRY_VERIFY(!first()->signalsBlocked());
        first()->click();
        QVERIFY(notice()->isHidden());
    }

    void severalMessagesAreSteppedThrough()
    {
        makeWindow(120);
        openNotice();
        QCOMPARE(first()->text() + next()->text(), QStringLiteral("关闭下一条(...)"));
        QCOMPARE(first()->width(), 178);
        m_platform.setUnread(3);
        m_window->openNotice();
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(3)"));
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 2 %2"));
        next()->click();
        QVERIFY(!next()->isEnabled());
        QTRY_COMPARE(next()->text(), QStringLiteral("下一条(2)"));
        QVERIFY(next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
    }

    void failuresKeepTheMessage()
    {
        makeWindow(2);
        openNotice();
        m_platform.setUnread(1);
        m_platform.addFault({{"path", kListPath}}, {{"status", 500}});
        // The request is under way when this returns.
        m_window->openNotice();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QCOMPARE(next()->text(), QStringLiteral("下一条(2)"));

        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        m_platform.addFault({{"path", kReadPath}}, {{"status", 500}});
        QStringList warning;
        expectWarning(warning);
        next()->click();
        QTRY_COMPARE(warning.value(0), QStringLiteral("消息调用警告"));
        QVERIFY(!warning.value(1).isEmpty());
        QCOMPARE(read.count(), 0);
        QVERIFY(!next()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
        m_platform.clearFaults();
        m_platform.setUnread(2);
        m_window->onReadListMessage("other");
        QTRY_VERIFY(next()->isEnabled());
    }

    void windowThatGoesDuringTheWait()
    {
        makeWindow(1);
        QTimer::singleShot(100, this, [this] { m_window.reset(); });
        m_window->openNotice();
        QVERIFY(!m_window);
    }

    void windowThatGoesBeforeTheReply()
    {
        m_platform.addFault({{"path", "/notification/v2/*"}}, {{"delay_ms", 300}});
        makeWindow(1);
        m_window->unreadMessages();
        m_window.reset();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
    }
};

QTEST_MAIN(TestMessages)
#include "test_messages.moc"

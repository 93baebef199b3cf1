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
    QString first() const { return notice()->firstButton()->text(); }
    QString next() const { return notice()->nextButton()->text(); }
    QString shownTitle() const { return notice()->findChildren<QPlainTextEdit*>().first()->toPlainText(); }
    int requests(const QString& path)
    {
        int count = 0;
        for (const QJsonObject& request : m_platform.record("http"))
            count += request.value("path") == path ? 1 : 0;
        return count;
    }
    void setUnread(int count)
    {
        QJsonArray messages;
        for (int i = 0; i < count; ++i)
            messages.append(QJsonObject{
                {"uuid", QString::number(i)},
                {"uid", "zhangsan"},
                {"send_uid", QStringLiteral("<b>管理员</b>")},
                {"title", QStringLiteral("<i>通知</i> %1 %2").arg(i)},
                {"content", "text"},
                {"created_at",
                 QString("2026-11-24T%1:%2:00Z").arg(i / 60, 2, 10, QChar('0')).arg(i % 60, 2, 10, QChar('0'))},
                {"read_at", ""}});
        m_platform.patchState({{"messages", messages}});
    }
    void makeWindow()
    {
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
        setUnread(0);
        m_platform.clearRecord();
    }
    void cleanup() { m_window.reset(); }

    void countIsAnnouncedOncePerChange()
    {
        setUnread(150);
        makeWindow();
        QTRY_COMPARE(MainWindow::unreadMessageCount, 150);
        QSignalSpy spy(m_window.get(), &MainWindow::newMessage);
        setUnread(2);
        const auto poll = [this] {
            const int asked = requests(kListPath);
            m_window->unreadMessages();
            QTRY_COMPARE(requests(kListPath), asked + 1);
        };
        poll();
        QTRY_COMPARE(spy.count(), 1);
        QCOMPARE(MainWindow::unreadMessageCount, 2);
        // A wait of its own second: polls within one second share their URL and thus their callback.
        const QString second = QTime::currentTime().toString();
        QTRY_VERIFY(QTime::currentTime().toString() != second);
        poll();
        m_platform.addFault({{"path", kListPath}}, {{"status", 500}});
        poll();
        QCOMPARE(spy.count(), 1);
        QCOMPARE(MainWindow::unreadMessageCount, 2);
    }

    void readingLowersTheCount()
    {
        makeWindow();
        MainWindow::unreadMessageCount = 1;
        m_window->onReadListMessage("x");
        QCOMPARE(MainWindow::unreadMessageCount, 0);
        m_window->readOneUnreadMessage();
        QCOMPARE(MainWindow::unreadMessageCount, 0);
        MainWindow::unreadMessageCount = 9;
        m_window->onReadAllMessage();
        QCOMPARE(MainWindow::unreadMessageCount, 0);
        QVERIFY(notice()->isHidden());
    }

    void oneMessageIsMarkedReadByTheWideButton()
    {
        setUnread(1);
        makeWindow();
        QVERIFY(notice()->windowFlags().testFlag(Qt::WindowStaysOnTopHint));
        QVERIFY(notice()->windowFlags().testFlag(Qt::FramelessWindowHint));
        openNotice();
        QCOMPARE(first(), QStringLiteral("已读"));
        QCOMPARE(notice()->firstButton()->width(), 390);
        QVERIFY(notice()->nextButton()->isHidden());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 0 %2"));

        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        notice()->firstButton()->click();
        notice()->firstButton()->click();
        QTRY_COMPARE(first(), QStringLiteral("关闭"));
        QTRY_COMPARE(read.count(), 1);
        QCOMPARE(read.first().first().toString(), QStringLiteral("0"));
        QCOMPARE(requests(kReadPath), 1);
        QVERIFY(notice()->isVisible());
        QTRY_VERIFY(!notice()->firstButton()->signalsBlocked());
        notice()->firstButton()->click();
        QVERIFY(notice()->isHidden());
    }

    void severalMessagesAreSteppedThrough()
    {
        setUnread(120);
        makeWindow();
        openNotice();
        QCOMPARE(first() + next(), QStringLiteral("关闭下一条(...)"));
        QCOMPARE(notice()->firstButton()->width(), 178);
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 119 %2"));
        setUnread(3);
        m_window->openNotice();
        QTRY_COMPARE(next(), QStringLiteral("下一条(3)"));
        notice()->nextButton()->click();
        QVERIFY(!notice()->nextButton()->isEnabled());
        QTRY_COMPARE(next(), QStringLiteral("下一条(2)"));
        QVERIFY(notice()->nextButton()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
        notice()->close();
        QVERIFY(notice()->isHidden());
    }

    void failedReadKeepsTheMessage()
    {
        setUnread(2);
        makeWindow();
        openNotice();
        QSignalSpy read(m_window.get(), &MainWindow::readNotify);
        m_platform.addFault({{"path", kReadPath}}, {{"status", 500}});
        QStringList warning;
        expectWarning(warning);
        notice()->nextButton()->click();
        QTRY_COMPARE(warning.value(0), QStringLiteral("消息调用警告"));
        QVERIFY(!warning.value(1).isEmpty());
        QCOMPARE(read.count(), 0);
        QVERIFY(!notice()->nextButton()->isEnabled());
        QCOMPARE(shownTitle(), QStringLiteral("<i>通知</i> 1 %2"));
        m_platform.clearFaults();
        m_window->onReadListMessage("other");
        QTRY_VERIFY(notice()->nextButton()->isEnabled());
    }

    void failedListChangesNothing()
    {
        setUnread(2);
        makeWindow();
        openNotice();
        setUnread(1);
        m_platform.addFault({{"path", kListPath}}, {{"status", 500}});
        // The request is under way when this returns.
        m_window->openNotice();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
        QCOMPARE(next(), QStringLiteral("下一条(2)"));
        QVERIFY(notice()->isVisible());
    }

    void windowThatGoesDuringTheWait()
    {
        setUnread(1);
        makeWindow();
        QTimer::singleShot(100, this, [this] { m_window.reset(); });
        m_window->openNotice();
        QVERIFY(!m_window);
    }

    void windowThatGoesBeforeTheReply()
    {
        setUnread(1);
        m_platform.addFault({{"path", "/notification/v2/*"}}, {{"delay_ms", 300}});
        makeWindow();
        m_window->unreadMessages();
        m_window.reset();
        QTRY_COMPARE(QNotification::qInstance->pendingRequests(), 0);
    }
};

QTEST_MAIN(TestMessages)
#include "test_messages.moc"

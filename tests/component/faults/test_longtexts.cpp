// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "closeguarddialog.h"
#include "httprequest.h"
#include "infowidget.h"
#include "logcapture.h"
#include "mainwindow.h"
#include "modifydialog.h"
#include "noticedialog.h"
#include "notification.h"
#include "notify.h"
#include "platformcontrol.h"
#include "replies.h"
#include "resumedialog.h"
#include "sessionhost.h"
#include "testrows.h"

#include <QComboBox>
#include <QLabel>
#include <QPlainTextEdit>
#include <QSignalSpy>

namespace
{

/// Near the 16 MiB that a reply may have.
constexpr int kLong = 16'000'000;
/// Enough to hold up a view that lays it all out for half a minute.
constexpr int kFreezing = 1'000'000;
constexpr int kLongestMs = 1000;

QByteArray json(const QJsonObject& object)
{
    return QJsonDocument(object).toJson(QJsonDocument::Compact);
}

qint64 milliseconds(const std::function<void()>& work)
{
    QElapsedTimer timer;
    timer.start();
    work();
    return timer.elapsed();
}

} // namespace

/// Texts as long as a reply may be, wherever one is shown: the client stays usable, and shows their beginning.
class TestLongTexts : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    BoxCloser m_boxes;
    const QString m_text = QString(kLong, 'x');
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<MainWindow> m_window;
    std::unique_ptr<SessionHost> m_host;

    /// Shows both pages and draws every window.
    void look()
    {
        m_window->show();
        for (const auto page : {&MainWindow::onNetinfoClicked, &MainWindow::onLogininfoClicked}) {
            (m_window.get()->*page)();
            for (QWidget* window : QApplication::topLevelWidgets()) {
                if (window->isVisible())
                    window->grab();
            }
        }
        QCoreApplication::processEvents();
    }
    /// What no widget's text or name for screen readers may be longer than.
    static int longestShown()
    {
        int longest = 0;
        for (QWidget* widget : QApplication::allWidgets()) {
            longest = std::max(longest, widget->accessibleName().size());
            longest = std::max(longest, widget->accessibleDescription().size());
            longest = std::max(longest, widget->toolTip().size());
            if (auto* label = qobject_cast<QLabel*>(widget))
                longest = std::max(longest, label->text().size());
            if (auto* box = qobject_cast<QComboBox*>(widget))
                longest = std::max(longest, box->currentText().size());
        }
        return longest;
    }
    QByteArray scenes(int count, const QString& name, const QString& code) const
    {
        QJsonArray list;
        for (int i = 0; i < count; ++i)
            list.append(QJsonObject{{"scene_name", name + QString::number(i)}, {"scene_code", code}});
        return json({{"code", 0}, {"message", list}});
    }
    QComboBox* box() const { return m_window->findChild<QComboBox*>(); }

private slots:
    void init()
    {
        m_log = std::make_unique<LogCapture>();
        m_platform.clearFaults();
        m_window = std::make_unique<MainWindow>(nullptr, 1020);
        m_host = std::make_unique<SessionHost>(*m_window);
        look();
    }
    void cleanup()
    {
        m_host.reset();
        m_window.reset();
        m_log.reset();
    }

    void valuesAreShownCut()
    {
        resumeDialog integrity;
        const QString half = m_text.left(kLong / 4);
        const QJsonObject names{{"gecos", half + ',' + half}, {"client_name", half}};
        const QString user = json({{"code", 0}, {"data", QJsonObject{{"user", names}}}});
        const QString organisation = json({{"code", 0}, {"data", QJsonObject{{"name", m_text}}}});
        const std::pair<const char*, std::function<void()>> feeds[] = {
            {"user", [&] { HttpRequest::GetInstance()->onUserInfo(200, user); }},
            {"organisation", [&] { HttpRequest::GetInstance()->onCompanyName(200, organisation); }},
            {"integrity", [&] { integrity.Notify(m_text, "/"); }},
        };
        // What parsing takes, at the most twice as much as one parser does for the longest of them.
        const qint64 parsing = 3 * milliseconds([&] { zent::parseOrganisationReply(organisation.toUtf8()); });
        for (const auto& [name, feed] : feeds) {
            const qint64 took = milliseconds(feed) - parsing;
            QVERIFY2(took < kLongestMs, qPrintable(name + QString::number(took)));
            const qint64 looked = milliseconds([this] { look(); });
            QVERIFY2(looked < kLongestMs, qPrintable(name + QString::number(looked)));
            // The caption stands before a value's name.
            QVERIFY2(longestShown() <= 1010, name);
        }
    }

    void boxesAreCut()
    {
        const QJsonObject refusal{{"code", 1}, {"msg", m_text.left(kFreezing)}};
        ModifyDialog dialog;
        m_platform.addFault({{"dbus", "ModifyUserPassword"}}, {{"value", QString::fromUtf8(json(refusal))}});
        dialog.modifyConfirm();
        closeGuarddialog guard;
        guard.onRemoveDomainStatus(200, json(refusal));
        QCOMPARE(m_boxes.texts.size(), 2);
        for (const QString& text : qAsConst(m_boxes.texts))
            QCOMPARE(text, m_text.left(1000) + QChar(0x2026));
    }

    void messagesAreCut()
    {
        for (const QString& letter : {QString("x"), QString::fromUtf8("汉"), QString("😀"), QString("\n")}) {
            const QString text = letter.repeated(kFreezing);
            const QJsonObject message{{"uuid", "u"}, {"title", text}, {"send_uid", text}, {"content", text}};
            m_platform.clearFaults();
            m_platform.addFault({{"path", "*/list"}},
                                {{"body", QString::fromUtf8(QJsonDocument(QJsonArray{message}).toJson())}});
            auto* notice = m_window->findChild<NoticeDialog*>();
            notice->hide();
            m_window->openNotice();
            QTRY_VERIFY_WITH_TIMEOUT(notice->isVisible(), 20000);
            QVERIFY(milliseconds([this] { look(); }) < kLongestMs);
            const QList<QPlainTextEdit*> views = notice->findChildren<QPlainTextEdit*>();
            QCOMPARE(views.size(), 2);
            QCOMPARE(views[0]->toPlainText(), text.left(1000) + QChar(0x2026));
            QCOMPARE(views[1]->toPlainText(), text.left(50000) + QChar(0x2026));
            QVERIFY(longestShown() <= 1010);
        }
    }

    void scenesAreWholeInside()
    {
        // The box cannot tell the two apart.
        QByteArray two = scenes(2, QString(999, 'n'), "code");
        m_window->analyseEvnData(&two);
        auto* panel = m_window->findChild<InfoWidget*>();
        QSignalSpy changed(panel, &InfoWidget::environmentChanegd);
        box()->setCurrentIndex(1);
        QCOMPARE(changed.size(), 1);
        QCOMPARE(box()->currentText(), QString(200, 'n') + QChar(0x2026));
        QCOMPARE(panel->getCurrentScene(), QString(999, 'n') + '1');
        QCOMPARE(m_window->getEvncode(panel->getCurrentScene()), 1);

        QByteArray many = scenes(kLong / 1000, QString(800, 's'), QString(150, 'c'));
        const qint64 parsing = milliseconds([&] { zent::parseSceneReply(many); });
        const qint64 took = milliseconds([&] { m_window->analyseEvnData(&many); }) - parsing;
        QVERIFY2(took < kLongestMs, qPrintable(QString::number(took)));
        QVERIFY(milliseconds([this] { look(); }) < kLongestMs);
    }

    void pushedMessagesAreCut()
    {
        // No notification service is there, so they come back to be shown as balloons.
        auto* notification = m_host->findChild<Notification*>();
        QVERIFY(milliseconds([&] { notification->Notify(1, "", m_text, m_text, m_text); }) < kLongestMs);
        QTRY_VERIFY(m_log->contains("neither a notification service nor a tray shows the message"));
        QVERIFY(milliseconds([&] { m_window->showTrayBalloon(m_text.left(1000), m_text.left(50000)); }) < kLongestMs);
    }
};

QTEST_MAIN(TestLongTexts)
#include "test_longtexts.moc"

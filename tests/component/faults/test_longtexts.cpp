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
#include "timelimits.h"

#include <QComboBox>
#include <QPlainTextEdit>
#include <QSignalSpy>
#include <QtTest>

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

double milliseconds(const std::function<void()>& work)
{
    const double began = processorMs();
    work();
    return processorMs() - began;
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
    /// Feeds the client, shows and draws all: fails where that takes long, or where a widget holds a long text.
    void stayUsable(const char* what, double parsing, const std::function<void()>& feed)
    {
        const double fed = milliseconds(feed) - parsing;
        const double drawn = milliseconds([this] { look(); });
        QVERIFY2(std::max(fed, drawn) < kLongestMs, qPrintable(QString("%1 %2 %3").arg(what).arg(fed).arg(drawn)));
        for (QWidget* widget : QApplication::allWidgets()) {
            // The caption stands before a value's name.
            for (const char* name : {"accessibleName", "accessibleDescription", "toolTip", "text", "currentText"})
                QVERIFY2(widget->property(name).toString().size() <= 1010, qPrintable(widget->objectName() + name));
        }
    }
    QByteArray scenes(int count, const QString& name, const QString& code) const
    {
        QJsonArray list;
        for (int i = 0; i < count; ++i)
            list.append(QJsonObject{{"scene_name", name + QString::number(i)}, {"scene_code", code}});
        return json({{"code", 0}, {"message", list}});
    }

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
        QByteArray many = scenes(kLong / 1000, QString(800, 's'), QString(150, 'c'));
        // What parsing takes, at the most twice as much as one parser does for the longest of them.
        const double parsing = 3 * milliseconds([&] { zent::parseOrganisationReply(organisation.toUtf8()); });
        auto* server = HttpRequest::GetInstance();
        stayUsable("user", parsing, [&] { server->onUserInfo(200, user); });
        stayUsable("organisation", parsing, [&] { server->onCompanyName(200, organisation); });
        stayUsable("integrity", 0, [&] { integrity.Notify(m_text, "/"); });
        stayUsable("scenes", parsing, [&] { m_window->analyseEvnData(&many); });
        // No notification service is there, so they come back to be shown as balloons.
        auto* notification = m_host->findChild<Notification*>();
        stayUsable("pushed", 0, [&] { notification->Notify(1, "", m_text, m_text, m_text); });
        QTRY_VERIFY(m_log->contains("neither a notification service nor a tray shows the message"));
        stayUsable("balloon", 0, [&] { m_window->showTrayBalloon(m_text.left(1000), m_text.left(50000)); });
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
            stayUsable("messages", 0, [] {});
            const QList<QPlainTextEdit*> views = notice->findChildren<QPlainTextEdit*>();
            QCOMPARE(views.size(), 2);
            QCOMPARE(views[0]->toPlainText(), text.left(1000) + QChar(0x2026));
            QCOMPARE(views[1]->toPlainText(), text.left(50000) + QChar(0x2026));
        }
    }

    void scenesAreWholeInside()
    {
        // The box cannot tell the two apart.
        QByteArray two = scenes(2, QString(999, 'n'), "code");
        m_window->analyseEvnData(&two);
        auto* panel = m_window->findChild<InfoWidget*>();
        QSignalSpy changed(panel, &InfoWidget::environmentChanegd);
        auto* box = m_window->findChild<QComboBox*>();
        box->setCurrentIndex(1);
        QCOMPARE(changed.size(), 1);
        QCOMPARE(box->currentText(), QString(200, 'n') + QChar(0x2026));
        QCOMPARE(panel->getCurrentScene(), QString(999, 'n') + '1');
        QCOMPARE(m_window->getEvncode(panel->getCurrentScene()), 1);
    }
};

QTEST_MAIN(TestLongTexts)
#include "test_longtexts.moc"

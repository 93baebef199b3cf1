// SPDX-License-Identifier: Apache-2.0
#include "session/sessionhost.h"

#include "dbusnames.h"
#include "filecontent.h"
#include "httprequest.h"
#include "integrity/resumedialog.h"
#include "mainwindow/mainwindow.h"
#include "replies/replies.h"
#include "session/desktopnotifier.h"
#include "session/notify.h"
#include "system/loginname.h"

#include <QDBusConnection>
#include <QDBusError>
#include <QDebug>

namespace
{

/// Whether a message pushed to `username` is for the session's user; one that names nobody is for everybody.
bool isForSessionUser(const QString& username)
{
    const QString login = sessionLoginName();
    return username.isEmpty() || username == login || username == QString(login).remove(QLatin1Char('@'));
}

} // namespace

SessionHost::SessionHost(MainWindow& window, QObject* parent)
    : QObject(parent), m_window(window), m_notification(new Notification(this)), m_notifier(new DesktopNotifier(this))
{
    askScenesAfterOrganisation();
    showPushedMessages();
    createIntegrityDialog();
    exportOnSessionBus();
}

SessionHost::~SessionHost()
{
    QDBusConnection bus = QDBusConnection::sessionBus();
    bus.unregisterService(zent::dbus::kClientService);
    bus.unregisterObject(zent::dbus::kNotificationPath);
    bus.unregisterObject(zent::dbus::kFullzonePath);
}

void SessionHost::createIntegrityDialog()
{
    m_integrityDialog = std::make_unique<resumeDialog>();
    QString host;
    QString port;
    zent::base::FileContent::instace()->getHostAndPort(host, port);
    m_integrityDialog->setIpPort(host, port);
}

void SessionHost::exportOnSessionBus()
{
    // The objects first: whoever waits for the name finds them behind it.
    exportObject(zent::dbus::kNotificationPath, m_notification);
    exportObject(zent::dbus::kFullzonePath, m_integrityDialog.get());
    QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.registerService(zent::dbus::kClientService))
        qWarning() << "SessionHost cannot own" << zent::dbus::kClientService << bus.lastError().message();
}

void SessionHost::exportObject(const QString& path, QObject* object)
{
    // Scriptable members only: a widget's own slots are nobody's business.
    constexpr auto kOwnMembers = QDBusConnection::ExportScriptableSlots | QDBusConnection::ExportScriptableSignals;
    QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.registerObject(path, object, kOwnMembers))
        qWarning() << "SessionHost cannot export" << path << bus.lastError().message();
}

void SessionHost::showPushedMessages()
{
    connect(m_notification, &Notification::onMessage, this,
            [this](int, const QString& username, const QString& title, const QString& message, const QString& sender) {
                if (isForSessionUser(username))
                    m_notifier->notify(title, sender, message);
                else
                    qInfo() << "SessionHost message for another user not shown";
            });
    connect(m_notifier, &DesktopNotifier::activated, &m_window, &MainWindow::openNotice);
    connect(m_notifier, &DesktopNotifier::unavailable, this, &SessionHost::showAsBalloon);
}

void SessionHost::showAsBalloon(const QString& title, const QString& sender, const QString& text)
{
    if (!m_window.showTrayBalloon(title, DesktopNotifier::body(sender, text)))
        qWarning() << "SessionHost neither a notification service nor a tray shows the message";
}

void SessionHost::askScenesAfterOrganisation()
{
    // The scenes otherwise follow an area reply, and this version sends no area request. Connected after the window,
    // so its own slot has stored the organisation by then.
    m_organisationConnection =
        connect(HttpRequest::GetInstance(), &HttpRequest::sigCompanyName, this, [this](int, const QString& data) {
            if (!zent::parseOrganisationReply(data.toUtf8()).isGood())
                return;
            disconnect(m_organisationConnection);
            m_window.getAllUserEnvironment();
        });
}

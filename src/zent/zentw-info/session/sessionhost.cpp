#include "sessionhost.h"

#include "httprequest.h"
#include "mainwindow.h"
#include "replies.h"
#include "trayhost.h"

SessionHost::SessionHost(MainWindow& window, QObject* parent) : QObject(parent), m_window(window)
{
    showTrayIconWhenHosted();
    askScenesAfterOrganisation();
}

void SessionHost::showTrayIconWhenHosted()
{
    if (m_window.hasSystemTrayIcon())
        return;
    auto* watch = new TrayHostWatch(this);
    connect(watch, &TrayHostWatch::hostAppeared, this, [this, watch] {
        watch->deleteLater();
        m_window.showSystemTrayIcon();
    });
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

// SPDX-License-Identifier: Apache-2.0
#include "tray/trayhost.h"

#include "dbusnames.h"

#include <KSelectionWatcher>
#include <QDBusConnection>
#include <QDBusError>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusReply>
#include <QDBusServiceWatcher>
#include <QDBusVariant>
#include <QDebug>
#include <QGuiApplication>
#include <QX11Info>

#include <limits>

namespace
{

using zent::dbus::kTrayWatcherPath;
using zent::dbus::kTrayWatcherService;

constexpr int kAskTimeoutMs = 500;
constexpr int kNoTimeout = std::numeric_limits<int>::max();

QDBusMessage hostRegisteredQuestion()
{
    QDBusMessage message = QDBusMessage::createMethodCall(kTrayWatcherService, kTrayWatcherPath,
                                                          zent::dbus::kPropertiesInterface, QStringLiteral("Get"));
    message << kTrayWatcherService << QStringLiteral("IsStatusNotifierHostRegistered");
    // Asking must not start a registry that the desktop has not started.
    message.setAutoStartService(false);
    return message;
}

bool hasDisplay()
{
    return QX11Info::isPlatformX11();
}

QByteArray traySelection()
{
    return "_NET_SYSTEM_TRAY_S" + QByteArray::number(QX11Info::appScreen());
}

bool xembedHostPresent()
{
    return hasDisplay() && KSelectionWatcher(traySelection().constData()).owner() != XCB_WINDOW_NONE;
}

/// Whether the registry says that a host has registered; false also for an error.
bool saysHosted(const QDBusMessage& reply)
{
    const QDBusReply<QDBusVariant> hosted = reply;
    return hosted.isValid() && hosted.value().variant().toBool();
}

/// Whether a registry is on the bus and keeps silent.
bool isSilence(const QDBusMessage& reply)
{
    return QDBusError(reply).type() == QDBusError::NoReply;
}

} // namespace

bool zent::trayhost::canShowIconNow()
{
    const QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.isConnected())
        return !hasDisplay() || xembedHostPresent();
    // The registry is asked even where the X display has a tray. Qt asks it too before its first icon, and waits for
    // the answer as long as the bus allows.
    const QDBusMessage reply = bus.call(hostRegisteredQuestion(), QDBus::Block, kAskTimeoutMs);
    return !isSilence(reply) && (saysHosted(reply) || xembedHostPresent());
}

TrayHostWatch::TrayHostWatch(QObject* parent) : QObject(parent)
{
    watchDisplay();
    watchBus();
    QMetaObject::invokeMethod(this, &TrayHostWatch::look, Qt::QueuedConnection);
}

void TrayHostWatch::watchDisplay()
{
    if (!hasDisplay())
        return;
    auto* watcher = new KSelectionWatcher(traySelection().constData(), -1, this);
    connect(watcher, &KSelectionWatcher::newOwner, this, &TrayHostWatch::look);
}

void TrayHostWatch::watchBus()
{
    QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.isConnected()) {
        qWarning() << "TrayHostWatch no session bus, only trays of the X display are seen";
        return;
    }
    // The registry's name alone does not make a host: it may be there long before one has registered.
    auto* registry = new QDBusServiceWatcher(kTrayWatcherService, bus, QDBusServiceWatcher::WatchForRegistration, this);
    connect(registry, &QDBusServiceWatcher::serviceRegistered, this, &TrayHostWatch::look);
    bus.connect(kTrayWatcherService, kTrayWatcherPath, kTrayWatcherService,
                QStringLiteral("StatusNotifierHostRegistered"), this, SLOT(look()));
}

void TrayHostWatch::look()
{
    if (m_announced)
        return;
    const QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.isConnected()) {
        if (xembedHostPresent())
            announce();
        return;
    }
    // However long a busy registry takes: only once it has answered, or left the bus, is Qt's own question to it safe.
    auto* call = new QDBusPendingCallWatcher(bus.asyncCall(hostRegisteredQuestion(), kNoTimeout), this);
    connect(call, &QDBusPendingCallWatcher::finished, this, [this, call] {
        call->deleteLater();
        if (saysHosted(call->reply()) || xembedHostPresent())
            announce();
    });
}

void TrayHostWatch::announce()
{
    if (m_announced)
        return;
    m_announced = true;
    qInfo() << "TrayHostWatch a tray host is there";
    emit hostAppeared();
}

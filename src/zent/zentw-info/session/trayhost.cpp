#include "trayhost.h"

#include "dbusnames.h"

#include <KSelectionWatcher>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QDBusReply>
#include <QDBusServiceWatcher>
#include <QDBusVariant>
#include <QDebug>
#include <QGuiApplication>
#include <QX11Info>

namespace
{

using zent::dbus::kTrayWatcherPath;
using zent::dbus::kTrayWatcherService;

constexpr int kAskTimeoutMs = 500;

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

bool notifierHostPresent(const QDBusConnection& bus)
{
    const QDBusReply<QDBusVariant> reply = bus.call(hostRegisteredQuestion(), QDBus::Block, kAskTimeoutMs);
    return reply.isValid() && reply.value().variant().toBool();
}

} // namespace

bool zent::trayhost::canShowIconNow()
{
    const QDBusConnection bus = QDBusConnection::sessionBus();
    if (!hasDisplay() && !bus.isConnected())
        return true;
    return xembedHostPresent() || (bus.isConnected() && notifierHostPresent(bus));
}

TrayHostWatch::TrayHostWatch(QObject* parent) : QObject(parent)
{
    watchDisplay();
    watchBus();
}

void TrayHostWatch::watchDisplay()
{
    if (!hasDisplay())
        return;
    auto* watcher = new KSelectionWatcher(traySelection().constData(), -1, this);
    connect(watcher, &KSelectionWatcher::newOwner, this, &TrayHostWatch::announce);
    if (watcher->owner() != XCB_WINDOW_NONE)
        QMetaObject::invokeMethod(this, &TrayHostWatch::announce, Qt::QueuedConnection);
}

void TrayHostWatch::watchBus()
{
    QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.isConnected()) {
        qWarning() << "TrayHostWatch"
                   << "no session bus, only trays of the X display are seen";
        return;
    }
    // The registry's name alone does not make a host: it may be there long before one has registered.
    auto* registry = new QDBusServiceWatcher(kTrayWatcherService, bus, QDBusServiceWatcher::WatchForRegistration, this);
    connect(registry, &QDBusServiceWatcher::serviceRegistered, this, &TrayHostWatch::askBus);
    bus.connect(kTrayWatcherService, kTrayWatcherPath, kTrayWatcherService,
                QStringLiteral("StatusNotifierHostRegistered"), this, SLOT(askBus()));
    askBus();
}

void TrayHostWatch::askBus()
{
    if (m_announced)
        return;
    auto* call = new QDBusPendingCallWatcher(QDBusConnection::sessionBus().asyncCall(hostRegisteredQuestion()), this);
    connect(call, &QDBusPendingCallWatcher::finished, this, [this, call] {
        call->deleteLater();
        const QDBusPendingReply<QDBusVariant> reply = *call;
        if (reply.isValid() && reply.value().variant().toBool())
            announce();
    });
}

void TrayHostWatch::announce()
{
    if (m_announced)
        return;
    m_announced = true;
    qInfo() << "TrayHostWatch"
            << "a tray host is there";
    emit hostAppeared();
}

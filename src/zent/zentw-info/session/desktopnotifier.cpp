// SPDX-License-Identifier: Apache-2.0
#include "session/desktopnotifier.h"

#include "displaytext.h"
#include "session/notificationnames.h"

#include <QDBusConnection>
#include <QDBusError>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QDBusServiceWatcher>
#include <QDebug>
#include <QTimer>
#include <QVariantMap>

#include <limits>
#include <utility>

namespace
{

using zent::dbus::kDesktopNotificationsPath;
using zent::dbus::kDesktopNotificationsService;

constexpr int kCallTimeoutMs = 5000;
constexpr int kNoTimeout = std::numeric_limits<int>::max();
constexpr int kServerDecidesExpiry = -1;
constexpr uint kReplacesNone = 0;
const QString kApplicationName = QStringLiteral("域管平台");
const QString kActionLabel = QStringLiteral("查看");
const QString kSenderLabel = QStringLiteral("发送人: ");
/// Name of the program's icon in the icon theme and of its desktop entry.
const QString kIconName = QStringLiteral("zentw-info");
/// The action of a click on the notification itself, by the desktop's convention.
const QString kDefaultAction = QStringLiteral("default");

QDBusMessage methodCall(const QString& method)
{
    return QDBusMessage::createMethodCall(kDesktopNotificationsService, kDesktopNotificationsPath,
                                          kDesktopNotificationsService, method);
}

} // namespace

DesktopNotifier::DesktopNotifier(QObject* parent) : QObject(parent)
{
    QDBusConnection bus = QDBusConnection::sessionBus();
    if (!bus.isConnected())
        return;
    bus.connect(kDesktopNotificationsService, kDesktopNotificationsPath, kDesktopNotificationsService,
                QStringLiteral("ActionInvoked"), this, SLOT(onActionInvoked(uint, QString)));
    bus.connect(kDesktopNotificationsService, kDesktopNotificationsPath, kDesktopNotificationsService,
                QStringLiteral("NotificationClosed"), this, SLOT(onNotificationClosed(uint, uint)));
    auto* watcher =
        new QDBusServiceWatcher(kDesktopNotificationsService, bus, QDBusServiceWatcher::WatchForOwnerChange, this);
    connect(watcher, &QDBusServiceWatcher::serviceOwnerChanged, this,
            [this](const QString&, const QString& oldOwner) { onServerChanged(oldOwner); });
}

QString DesktopNotifier::body(const QString& sender, const QString& text)
{
    return sender.isEmpty() ? text : kSenderLabel + sender + QLatin1Char('\n') + text;
}

template <typename Function>
QDBusPendingCallWatcher* DesktopNotifier::call(const QDBusMessage& question, Function finished)
{
    const QDBusPendingCall pending = QDBusConnection::sessionBus().asyncCall(question, kCallTimeoutMs);
    auto* watcher = new QDBusPendingCallWatcher(pending, this);
    connect(watcher, &QDBusPendingCallWatcher::finished, this, [watcher, finished] {
        watcher->deleteLater();
        finished(*watcher);
    });
    return watcher;
}

void DesktopNotifier::notify(const QString& title, const QString& sender, const QString& text)
{
    const Message message{zent::display::cut(title), zent::display::cut(sender),
                          zent::display::cut(text, zent::display::kContentLength)};
    if (!QDBusConnection::sessionBus().isConnected()) {
        // A call on a bus that is not there would never finish.
        QMetaObject::invokeMethod(
            this, [this, message] { giveUp(message); }, Qt::QueuedConnection);
        return;
    }
    if (m_capabilities == Capabilities::Known) {
        send(message);
        return;
    }
    m_waiting.append(message);
    if (m_capabilities == Capabilities::Unknown)
        askCapabilities();
}

void DesktopNotifier::onServerChanged(const QString& oldOwner)
{
    // A service that appears may be the one that our question has started.
    if (oldOwner.isEmpty())
        return;
    ++m_server;
    m_ids.clear();
    const bool wasAsked = m_capabilities == Capabilities::Asked;
    m_capabilities = Capabilities::Unknown;
    if (!wasAsked)
        return;
    delete m_capabilitiesCall;
    // Not asked again: the bus would start a service that dies of the question over and over.
    giveUpWaiting();
}

void DesktopNotifier::askCapabilities()
{
    m_capabilities = Capabilities::Asked;
    m_capabilitiesCall = call(methodCall(QStringLiteral("GetCapabilities")),
                              [this](const QDBusPendingCall& answer) { onCapabilities(answer); });
}

void DesktopNotifier::onCapabilities(const QDBusPendingCall& call)
{
    const QDBusPendingReply<QStringList> reply = call;
    m_capabilities = reply.isValid() ? Capabilities::Known : Capabilities::Unknown;
    m_bodyMarkup = reply.isValid() && reply.value().contains(QStringLiteral("body-markup"));
    if (reply.isError()) {
        qWarning() << "DesktopNotifier GetCapabilities" << reply.error().name() << reply.error().message();
        giveUpWaiting();
        return;
    }
    const QVector<Message> waiting = std::exchange(m_waiting, {});
    for (const Message& message : waiting)
        send(message);
}

void DesktopNotifier::send(const Message& message)
{
    // The title as well: services with markup are free to format it, and nothing pushed may act as markup anywhere.
    const auto shown = [this](const QString& text) { return m_bodyMarkup ? text.toHtmlEscaped() : text; };
    QDBusMessage question = methodCall(QStringLiteral("Notify"));
    question << kApplicationName << kReplacesNone << kIconName << shown(message.title)
             << shown(body(message.sender, message.text)) << QStringList{kDefaultAction, kActionLabel}
             << QVariantMap{{QStringLiteral("desktop-entry"), kIconName}} << kServerDecidesExpiry;
    // Without the call's own time limit, behind which a late answer would be lost.
    auto* watcher = new QDBusPendingCallWatcher(QDBusConnection::sessionBus().asyncCall(question, kNoTimeout), this);
    auto* patience = new QTimer(watcher);
    patience->setSingleShot(true);
    patience->start(kCallTimeoutMs);
    connect(patience, &QTimer::timeout, this, [this, message] {
        qWarning() << "DesktopNotifier Notify" << QDBusError::errorString(QDBusError::NoReply);
        giveUp(message);
    });
    connect(watcher, &QDBusPendingCallWatcher::finished, this, [this, watcher, patience, message, server = m_server] {
        watcher->deleteLater();
        if (!patience->isActive())
            withdraw(*watcher);
        else if (server == m_server)
            onSent(*watcher, message);
        else if (watcher->isError())
            giveUp(message);
        patience->stop();
    });
}

void DesktopNotifier::withdraw(const QDBusPendingCall& call)
{
    // The message has been shown otherwise since.
    const QDBusPendingReply<uint> reply = call;
    if (!reply.isValid())
        return;
    QDBusMessage question = methodCall(QStringLiteral("CloseNotification"));
    question << reply.value();
    QDBusConnection::sessionBus().send(question);
}

void DesktopNotifier::onSent(const QDBusPendingCall& call, const Message& message)
{
    const QDBusPendingReply<uint> reply = call;
    if (reply.isValid()) {
        m_ids.insert(reply.value());
        return;
    }
    qWarning() << "DesktopNotifier Notify" << reply.error().name() << reply.error().message();
    giveUp(message);
}

void DesktopNotifier::giveUpWaiting()
{
    const QVector<Message> waiting = std::exchange(m_waiting, {});
    for (const Message& message : waiting)
        giveUp(message);
}

void DesktopNotifier::giveUp(const Message& message)
{
    emit unavailable(message.title, message.sender, message.text);
}

void DesktopNotifier::onActionInvoked(uint id, const QString& action)
{
    if (action == kDefaultAction && m_ids.contains(id))
        emit activated();
}

void DesktopNotifier::onNotificationClosed(uint id, uint)
{
    m_ids.remove(id);
}

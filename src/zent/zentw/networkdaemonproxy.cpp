// SPDX-License-Identifier: Apache-2.0
#include "networkdaemonproxy.h"

#include "dbusnames.h"

#include <QDBusArgument>
#include <QDBusError>
#include <QDBusMessage>
#include <QDBusPendingCall>
#include <QDeadlineTimer>
#include <QDebug>
#include <QElapsedTimer>

namespace
{

/// A daemon that leaves the bus ends a call at once, with an error of the same name as a time-out.
constexpr int kHangMs = 1000;
constexpr int kPauseMs = 60000;

/// Every proxy waits for the same daemon.
QDeadlineTimer& pause()
{
    static QDeadlineTimer pause;
    return pause;
}

} // namespace

NetworkDaemonProxy::NetworkDaemonProxy(const QString& service, const QString& path, const QDBusConnection& connection,
                                       QObject* parent)
    : QDBusAbstractInterface(service, path, "com.vantor.daemon.Network", connection, parent)
{
}

std::optional<QString> NetworkDaemonProxy::activeConnectionInfo()
{
    if (!pause().hasExpired())
        return std::nullopt;
    QElapsedTimer waited;
    waited.start();
    QDBusPendingCall call = asyncCall(QStringLiteral("GetActiveConnectionInfo"));
    call.waitForFinished();
    if (call.isError()) {
        const bool hangs = call.error().type() == QDBusError::NoReply && waited.hasExpired(kHangMs);
        if (hangs)
            pause().setRemainingTime(kPauseMs);
        qWarning().noquote() << "GetActiveConnectionInfo failed:" << call.error().name() << call.error().message()
                             << (hangs ? "The network daemon is not asked again for 60 s." : "");
        return std::nullopt;
    }
    const QVariant answer = call.reply().arguments().value(0);
    if (answer.canConvert<QDBusArgument>())
        return qdbus_cast<QString>(answer);
    return answer.toString();
}

#include "networkdaemonproxy.h"

#include "dbusnames.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QDBusPendingCall>

NetworkDaemonProxy::NetworkDaemonProxy(const QString& service, const QString& path, const QDBusConnection& connection,
                                       QObject* parent)
    : QDBusAbstractInterface(service, path, "com.vantor.daemon.Network", connection, parent)
{
}

std::optional<QString> NetworkDaemonProxy::activeConnectionInfo()
{
    QDBusPendingCall call = asyncCall(QStringLiteral("GetActiveConnectionInfo"));
    call.waitForFinished();
    if (call.isError())
        return std::nullopt;
    const QVariant answer = call.reply().arguments().value(0);
    if (answer.canConvert<QDBusArgument>())
        return qdbus_cast<QString>(answer);
    return answer.toString();
}

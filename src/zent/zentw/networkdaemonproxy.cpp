#include "networkdaemonproxy.h"

#include "dbusnames.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QDBusPendingCall>
#include <QDebug>
#include <QElapsedTimer>

namespace
{

/// A call that fails after this long has run into a time-out, of this bus connection or of the bus itself.
constexpr int kHangMs = 1000;
constexpr int kPauseMs = 60000;

} // namespace

NetworkDaemonProxy::NetworkDaemonProxy(const QString& service, const QString& path, const QDBusConnection& connection,
                                       QObject* parent)
    : QDBusAbstractInterface(service, path, "com.vantor.daemon.Network", connection, parent)
{
}

std::optional<QString> NetworkDaemonProxy::activeConnectionInfo()
{
    if (!m_pause.hasExpired())
        return std::nullopt;
    QElapsedTimer waited;
    waited.start();
    QDBusPendingCall call = asyncCall(QStringLiteral("GetActiveConnectionInfo"));
    call.waitForFinished();
    if (call.isError()) {
        const bool hangs = waited.hasExpired(kHangMs);
        if (hangs)
            m_pause.setRemainingTime(kPauseMs);
        qWarning().noquote() << "GetActiveConnectionInfo failed:" << call.error().name() << call.error().message()
                             << (hangs ? "The network daemon is not asked again for 60 s." : "");
        return std::nullopt;
    }
    const QVariant answer = call.reply().arguments().value(0);
    if (answer.canConvert<QDBusArgument>())
        return qdbus_cast<QString>(answer);
    return answer.toString();
}

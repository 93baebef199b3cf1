#pragma once

#include <QByteArray>
#include <QJsonArray>
#include <QString>

#include <optional>
#include <vector>

namespace zent
{

/// One active connection as the network daemon describes it; what the daemon left out is empty.
struct ActiveConnection {
    bool primary = false;
    QString hwAddress;
    QString speed;
    QString address;
    QString mask;
    /// The first gateway and the first name server; the others are not shown anywhere.
    QString gateway;
    QString dns;
};

/// The daemon's answer; nothing when `json` is not a JSON array, or when what is read of a connection has another type
/// than it should.
std::optional<QJsonArray> parseConnectionArray(const QByteArray& json);

/// The connections of the answer, in its order.
std::vector<ActiveConnection> activeConnections(const QJsonArray& array);

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
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
    QString hwAddress;
    QString speed;
    QString address;
    QString mask;
    /// The first gateway and the first name server; the others are not shown anywhere.
    QString gateway;
    QString dns;
};

/// The daemon's answer; nothing when `json` is not a JSON array.
std::optional<QJsonArray> parseConnectionArray(const QByteArray& json);

/// The primary connections of the answer, in its order; nothing when a value of one has another type than it should.
/// Of other connections and elements nothing is read.
std::optional<std::vector<ActiveConnection>> primaryConnections(const QJsonArray& array);

/// The hardware address of the first primary connection, whatever its other values are; nothing without one.
std::optional<QString> primaryHwAddress(const QJsonArray& array);

} // namespace zent

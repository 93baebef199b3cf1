// SPDX-License-Identifier: Apache-2.0
#include "activeconnections.h"

#include "jsonreader.h"

#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace zent
{

namespace
{

const char* const kHwAddress = "HwAddress";

bool isPrimary(const QJsonValue& value)
{
    return value.toObject().value(QLatin1String("IsPrimaryConnection")) == QJsonValue(true);
}

/// Nothing when a value has another type than it should.
std::optional<ActiveConnection> connectionFromJson(const QJsonValue& value)
{
    base::JsonReader object(value);
    base::JsonReader ip4(object.object("Ip4"));
    ActiveConnection connection;
    connection.hwAddress = object.text(kHwAddress);
    connection.speed = object.text("Speed");
    connection.address = ip4.text("Address");
    connection.mask = ip4.text("Mask");
    connection.gateway = ip4.firstText("Gateways");
    connection.dns = ip4.firstText("Dnses");
    if (!object.isGood() || !ip4.isGood())
        return std::nullopt;
    return connection;
}

} // namespace

std::optional<QJsonArray> parseConnectionArray(const QByteArray& json)
{
    const QJsonDocument document = QJsonDocument::fromJson(json);
    return document.isArray() ? std::optional<QJsonArray>(document.array()) : std::nullopt;
}

std::optional<std::vector<ActiveConnection>> primaryConnections(const QJsonArray& array)
{
    std::vector<ActiveConnection> connections;
    for (const QJsonValue& value : array) {
        if (!isPrimary(value))
            continue;
        const auto connection = connectionFromJson(value);
        if (!connection)
            return std::nullopt;
        connections.push_back(*connection);
    }
    return connections;
}

std::optional<QString> primaryHwAddress(const QJsonArray& array)
{
    const auto primary = std::find_if(array.begin(), array.end(), isPrimary);
    if (primary == array.end())
        return std::nullopt;
    return (*primary).toObject().value(QLatin1String(kHwAddress)).toString();
}

} // namespace zent

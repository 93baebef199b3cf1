#include "activeconnections.h"

#include <QJsonDocument>
#include <QJsonObject>

namespace zent
{

namespace
{

ActiveConnection connectionFromJson(const QJsonObject& object)
{
    const QJsonObject ip4 = object.value(QLatin1String("Ip4")).toObject();
    ActiveConnection connection;
    connection.primary = object.value(QLatin1String("IsPrimaryConnection")).toBool();
    connection.hwAddress = object.value(QLatin1String("HwAddress")).toString();
    connection.speed = object.value(QLatin1String("Speed")).toString();
    connection.address = ip4.value(QLatin1String("Address")).toString();
    connection.mask = ip4.value(QLatin1String("Mask")).toString();
    connection.gateway = ip4.value(QLatin1String("Gateways")).toArray().first().toString();
    connection.dns = ip4.value(QLatin1String("Dnses")).toArray().first().toString();
    return connection;
}

} // namespace

std::optional<QJsonArray> parseConnectionArray(const QByteArray& json)
{
    const QJsonDocument document = QJsonDocument::fromJson(json);
    if (!document.isArray())
        return std::nullopt;
    return document.array();
}

std::vector<ActiveConnection> activeConnections(const QJsonArray& array)
{
    std::vector<ActiveConnection> connections;
    connections.reserve(static_cast<std::size_t>(array.size()));
    for (const QJsonValue& value : array)
        connections.push_back(connectionFromJson(value.toObject()));
    return connections;
}

} // namespace zent

#include "activeconnections.h"

#include "jsonreader.h"

#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace zent
{

namespace
{

/// Nothing when a value has another type than it should.
std::optional<ActiveConnection> connectionFromJson(const QJsonValue& value)
{
    base::JsonReader object(value);
    base::JsonReader ip4(object.object("Ip4"));
    ActiveConnection connection;
    connection.primary = object.flag("IsPrimaryConnection");
    connection.hwAddress = object.text("HwAddress");
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
    const QJsonArray array = document.array();
    if (!document.isArray() || !std::all_of(array.begin(), array.end(), connectionFromJson))
        return std::nullopt;
    return array;
}

std::vector<ActiveConnection> activeConnections(const QJsonArray& array)
{
    std::vector<ActiveConnection> connections;
    connections.reserve(static_cast<std::size_t>(array.size()));
    for (const QJsonValue& value : array)
        connections.push_back(connectionFromJson(value).value_or(ActiveConnection()));
    return connections;
}

} // namespace zent

#include "activeconnections.h"

#include "jsontypes.h"

#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace zent
{

namespace
{

bool isConnection(const QJsonValue& value)
{
    const QJsonObject object = value.toObject();
    const QJsonObject ip4 = object.value(QLatin1String("Ip4")).toObject();
    const auto startsWithText = [&ip4](const char* key) {
        const QJsonArray texts = ip4.value(QLatin1String(key)).toArray();
        return texts.isEmpty() || texts.first().isString();
    };
    return value.isObject() &&
           base::hasTypes(object, {{"IsPrimaryConnection", QJsonValue::Bool},
                                   {"HwAddress", QJsonValue::String},
                                   {"Speed", QJsonValue::String},
                                   {"Ip4", QJsonValue::Object}}) &&
           base::hasTypes(ip4, {{"Address", QJsonValue::String},
                                {"Mask", QJsonValue::String},
                                {"Gateways", QJsonValue::Array},
                                {"Dnses", QJsonValue::Array}}) &&
           startsWithText("Gateways") && startsWithText("Dnses");
}

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
    const QJsonArray array = document.array();
    if (!document.isArray() || !std::all_of(array.begin(), array.end(), isConnection))
        return std::nullopt;
    return array;
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

#include "replies.h"

#include "jsontypes.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <QStringList>

#include <algorithm>
#include <optional>

namespace zent
{

namespace
{

const QString kCode = QStringLiteral("code");
const QString kData = QStringLiteral("data");
const QString kName = QStringLiteral("name");
/// Misspelt by the server, too.
const QString kGroups = QStringLiteral("supplementtary_groups");

/// What all replies share: JSON, the code 0, and then `extract` finds the values in the object or nothing.
template <typename T, typename Extract>
Reply<T> parseReply(const QByteArray& body, Extract extract)
{
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(body, &error);
    if (error.error != QJsonParseError::NoError)
        return {ReplyState::NotJson, {}};
    const QJsonObject object = document.object();
    // A code that is missing or no number counts as a failure, not as the 0 that means success.
    if (object.value(kCode).toInt(-1) != 0)
        return {ReplyState::Failed, {}};
    std::optional<T> value = extract(object);
    if (!value)
        return {ReplyState::Failed, {}};
    return {ReplyState::Good, std::move(*value)};
}

std::optional<QString> nameIn(const QJsonValue& value)
{
    if (!value.isObject() || !base::hasTypes(value.toObject(), {{"name", QJsonValue::String}}))
        return std::nullopt;
    return value.toObject().value(kName).toString();
}

/// Whether what is shown of a user has the right types; the number, which is only logged, need not.
bool isUser(const QJsonValue& value)
{
    const QJsonObject user = value.toObject();
    const QJsonArray groups = user.value(kGroups).toArray();
    return value.isObject() &&
           base::hasTypes(user, {{"gecos", QJsonValue::String},
                                 {"client_name", QJsonValue::String},
                                 {"supplementtary_groups", QJsonValue::Array}}) &&
           (groups.isEmpty() || nameIn(groups.first()));
}

bool isScene(const QJsonValue& value)
{
    return value.isObject() &&
           base::hasTypes(value.toObject(), {{"scene_name", QJsonValue::String}, {"scene_code", QJsonValue::String}});
}

} // namespace

Reply<UserData> parseUserReply(const QByteArray& body)
{
    return parseReply<UserData>(body, [](const QJsonObject& reply) -> std::optional<UserData> {
        const QJsonValue value = reply.value(kData).toObject().value(QLatin1String("user"));
        if (!isUser(value))
            return std::nullopt;
        const QJsonObject user = value.toObject();
        const QStringList gecos = user.value(QLatin1String("gecos")).toString().split(QLatin1Char(','));
        UserData data;
        data.gecosFirst = gecos.first();
        data.gecosLast = gecos.last();
        const QJsonArray groups = user.value(kGroups).toArray();
        data.groupName = groups.first().toObject().value(kName).toString();
        data.clientName = user.value(QLatin1String("client_name")).toString();
        data.id = user.value(QLatin1String("id")).toInt();
        data.permissions = user.value(QLatin1String("permissions")).toArray();
        return data;
    });
}

Reply<QString> parseOrganisationReply(const QByteArray& body)
{
    return parseReply<QString>(body, [](const QJsonObject& reply) { return nameIn(reply.value(kData)); });
}

Reply<QString> parseAreaReply(const QByteArray& body)
{
    return parseReply<QString>(body,
                               [](const QJsonObject& reply) { return nameIn(reply.value(kData).toArray().first()); });
}

Reply<std::vector<Scene>> parseSceneReply(const QByteArray& body)
{
    return parseReply<std::vector<Scene>>(body, [](const QJsonObject& reply) -> std::optional<std::vector<Scene>> {
        const QJsonValue message = reply.value(QLatin1String("message"));
        const QJsonArray elements = message.toArray();
        if (!message.isArray() || !std::all_of(elements.begin(), elements.end(), isScene))
            return std::nullopt;
        std::vector<Scene> scenes;
        for (const QJsonValue& element : elements) {
            const QJsonObject scene = element.toObject();
            scenes.push_back({scene.value(QLatin1String("scene_name")).toString(),
                              scene.value(QLatin1String("scene_code")).toString()});
        }
        return scenes;
    });
}

} // namespace zent

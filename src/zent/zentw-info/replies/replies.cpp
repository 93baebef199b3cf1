// SPDX-License-Identifier: Apache-2.0
#include "replies/replies.h"

#include "jsonreader.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>
#include <QStringList>

#include <optional>

namespace zent
{

namespace
{

const QString kCode = QStringLiteral("code");
const QString kData = QStringLiteral("data");

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
    base::JsonReader reader(value);
    const QString name = reader.text("name");
    return reader.isGood() ? std::optional<QString>(name) : std::nullopt;
}

std::optional<Scene> sceneIn(const QJsonValue& value)
{
    base::JsonReader reader(value);
    Scene scene{reader.identifier("scene_name"), reader.identifier("scene_code")};
    return reader.isGood() ? std::optional<Scene>(scene) : std::nullopt;
}

} // namespace

Reply<UserData> parseUserReply(const QByteArray& body)
{
    return parseReply<UserData>(body, [](const QJsonObject& reply) -> std::optional<UserData> {
        const QJsonValue value = reply.value(kData).toObject().value(QLatin1String("user"));
        base::JsonReader user(value);
        const QStringList gecos = user.text("gecos").split(QLatin1Char(','));
        // The agreed spelling.
        const QJsonArray groups = user.array("supplementtary_groups");
        const std::optional<QString> group = groups.isEmpty() ? QString() : nameIn(groups.first());
        UserData data;
        data.gecosFirst = gecos.first();
        data.gecosLast = gecos.last();
        data.clientName = user.text("client_name");
        if (!user.isGood() || !group)
            return std::nullopt;
        data.groupName = *group;
        // These two are only logged, whatever they are.
        data.id = value.toObject().value(QLatin1String("id")).toInt();
        data.permissions = value.toObject().value(QLatin1String("permissions")).toArray();
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
        if (!message.isArray())
            return std::nullopt;
        std::vector<Scene> scenes;
        const QJsonArray elements = message.toArray();
        for (const QJsonValue& element : elements) {
            const auto scene = sceneIn(element);
            if (!scene)
                return std::nullopt;
            scenes.push_back(*scene);
        }
        return scenes;
    });
}

bool hasCode(const QByteArray& body)
{
    const QJsonValue code = QJsonDocument::fromJson(body).object().value(kCode);
    // Both defaults come back where there is no integer.
    return code.toInt(0) == code.toInt(1);
}

} // namespace zent

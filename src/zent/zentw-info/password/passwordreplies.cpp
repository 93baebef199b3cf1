#include "passwordreplies.h"

#include <QJsonDocument>
#include <QJsonObject>

namespace zent
{

std::optional<IdentityReply> parseIdentityReply(const QString& text)
{
    const QJsonObject reply = QJsonDocument::fromJson(text.toUtf8()).object();
    const QJsonValue code = reply.value(QLatin1String("code"));
    if (code.isUndefined())
        return std::nullopt;
    return IdentityReply{code.toInt(), reply.value(QLatin1String("msg")).toString()};
}

std::optional<PasswordServerReply> parsePasswordServerReply(const QByteArray& body)
{
    const QJsonObject reply = QJsonDocument::fromJson(body).object();
    const QJsonValue code = reply.value(QLatin1String("code"));
    if (!code.isDouble())
        return std::nullopt;
    return PasswordServerReply{code.toInt(-1), reply.value(QLatin1String("data")).toString(),
                               reply.value(QLatin1String("message")).toString()};
}

std::optional<int> parseMinimumLength(const QByteArray& sceneConfig)
{
    constexpr int kLargestMinimum = 40;
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(sceneConfig, &error);
    if (error.error != QJsonParseError::NoError)
        return std::nullopt;
    const QJsonObject rule = document.object().value(QLatin1String("pam_cracklib")).toObject();
    const int length = rule.value(QLatin1String("minlen")).toInt();
    return length < 0 || length > kLargestMinimum ? kDefaultMinimumLength : length;
}

} // namespace zent

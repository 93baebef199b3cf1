// SPDX-License-Identifier: Apache-2.0
#include "password/passwordreplies.h"

#include "jsonreader.h"

#include <QJsonDocument>
#include <QJsonObject>

#include <cmath>

namespace zent
{

std::optional<IdentityReply> parseIdentityReply(const QString& text)
{
    const QJsonObject reply = QJsonDocument::fromJson(text.toUtf8()).object();
    const QJsonValue code = reply.value(QLatin1String("code"));
    if (code.isUndefined())
        return std::nullopt;
    const int number = code.isDouble() ? code.toInt(IdentityReply::kUnknownCode) : 0;
    return IdentityReply{number, reply.value(QLatin1String("msg")).toString()};
}

std::optional<PasswordServerReply> parsePasswordServerReply(const QByteArray& body)
{
    const QJsonObject reply = QJsonDocument::fromJson(body).object();
    const QJsonValue code = reply.value(QLatin1String("code"));
    if (!code.isDouble())
        return std::nullopt;
    return PasswordServerReply{code.toInt(-1), reply.value(QLatin1String("data")).toString(),
                               base::identifierIn(reply.value(QLatin1String("message")))};
}

std::optional<int> parseMinimumLength(const QByteArray& sceneConfig)
{
    constexpr int kLargestMinimum = 40;
    const QJsonDocument document = QJsonDocument::fromJson(sceneConfig);
    const QJsonValue rule = document.object().value(QLatin1String("pam_cracklib"));
    const QJsonValue length = rule.toObject().value(QLatin1String("minlen"));
    // A broken file must not switch the rule off.
    if (!document.isObject() || !(rule.isObject() || rule.isUndefined()))
        return std::nullopt;
    if (length.isUndefined())
        return 0;
    const double number = length.toDouble(0.5);
    if (std::floor(number) != number)
        return std::nullopt;
    return number < 0 || number > kLargestMinimum ? kDefaultMinimumLength : static_cast<int>(number);
}

} // namespace zent

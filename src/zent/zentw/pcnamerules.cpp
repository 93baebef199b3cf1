#include "pcnamerules.h"

#include <QJsonDocument>
#include <QJsonObject>

namespace zent
{

namespace
{

bool isSuccess(const QJsonObject& reply)
{
    return reply.value(QLatin1String("code")).toInt(-1) == 0;
}

} // namespace

std::optional<PcNameVerdict> parsePcNameVerdict(const QByteArray& json)
{
    const QJsonDocument document = QJsonDocument::fromJson(json);
    if (!document.isObject())
        return std::nullopt;
    const QJsonObject reply = document.object();
    return PcNameVerdict{isSuccess(reply), reply.value(QLatin1String("msg")).toString()};
}

PcNameRule parsePcNameRule(const QByteArray& json)
{
    PcNameRule rule;
    QJsonParseError error;
    const QJsonObject reply = QJsonDocument::fromJson(json, &error).object();
    if (error.error != QJsonParseError::NoError) {
        rule.parseError = error.errorString();
        return rule;
    }
    if (!isSuccess(reply)) {
        rule.state = PcNameRule::State::Refused;
        return rule;
    }
    const QByteArray inner = reply.value(QLatin1String("message")).toString().toUtf8();
    const QJsonValue expression =
        QJsonDocument::fromJson(inner, &error).object().value(QLatin1String("regular_expression"));
    if (error.error != QJsonParseError::NoError) {
        rule.parseError = error.errorString();
        return rule;
    }
    rule.state = expression.isString() ? PcNameRule::State::Given : PcNameRule::State::Missing;
    rule.expression = expression.toString();
    return rule;
}

QString withoutSlashes(const QString& rule)
{
    QString stripped = rule;
    if (stripped.startsWith(QLatin1Char('/')))
        stripped.remove(0, 1);
    if (stripped.endsWith(QLatin1Char('/')))
        stripped.chop(1);
    return stripped;
}

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
#include "messages/notifymessages.h"

#include "jsonreader.h"
#include "terminalinfo.h"

#include <QDateTime>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

namespace zent
{

namespace
{

constexpr int kHttpsPort = 443;
/// Times are shown at UTC+8, whatever the terminal's own zone, as agreed.
constexpr int kDisplayOffsetSeconds = 28800;

NotifyMessage messageFromJson(const QJsonObject& object)
{
    const auto text = [&object](const char* key) { return object.value(QLatin1String(key)).toString(); };
    return {base::identifierIn(object.value(QLatin1String("uuid"))),
            text("uid"),
            text("send_uid"),
            text("title"),
            text("content"),
            text("created_at"),
            text("read_at")};
}

} // namespace

QString NotifyConfig::url(const QString& kind) const
{
    return QStringLiteral("%1://%2:%3%4/%5").arg(protocol, host, QString::number(port), prefix, kind);
}

std::optional<NotifyConfig> parseNotifyConfig(const QByteArray& infoFile)
{
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(infoFile, &error);
    if (error.error != QJsonParseError::NoError)
        return std::nullopt;
    const QJsonObject object = document.object();
    NotifyConfig config;
    config.protocol = object.value(QLatin1String("protocol")).toString(config.protocol);
    config.host = object.value(base::infokey::kServerHost).toString();
    config.prefix = object.value(QLatin1String("notificition_prefix")).toString(config.prefix);
    config.token = base::identifierIn(object.value(QLatin1String("token")));
    if (config.protocol == QLatin1String("https"))
        config.port = kHttpsPort;
    // A number here, while the scene requests read the same key as text; a text gives port 0.
    if (object.contains(base::infokey::kServerPort))
        config.port = object.value(base::infokey::kServerPort).toInt();
    return config;
}

QList<NotifyMessage> parseMessageList(const QByteArray& body)
{
    QList<NotifyMessage> messages;
    const QJsonArray elements = QJsonDocument::fromJson(body).array();
    for (const QJsonValue& value : elements) {
        if (value.isObject())
            messages.append(messageFromJson(value.toObject()));
    }
    return messages;
}

NotifyMessageResponse parseMessageReply(const HeaderLookup& header, const QByteArray& body)
{
    NotifyMessageResponse response;
    response.total = header("X-Total-Count").toInt();
    response.limit = header("X-Total-Limit").toInt();
    response.offset = header("X-Total-Offset").toInt();
    response.messages = parseMessageList(body);
    return response;
}

QString formatServerTime(const QString& serverTime, bool relative, const QDate& today)
{
    QString text = serverTime;
    text.replace(QLatin1Char('T'), QLatin1Char(' ')).remove(QLatin1Char('Z'));
    // Date and time apart: together they would be read as local time, which some zones do not have every hour of.
    const QDate date = QDate::fromString(text.section(QLatin1Char(' '), 0, 0), QStringLiteral("yyyy-MM-dd"));
    const QTime time = QTime::fromString(text.section(QLatin1Char(' '), 1), QStringLiteral("hh:mm:ss"));
    if (!date.isValid() || !time.isValid())
        return QString();
    const QDateTime shown = QDateTime(date, time, Qt::UTC).addSecs(kDisplayOffsetSeconds);
    const qint64 age = shown.date().daysTo(today);
    if (relative && (age == 0 || age == 1)) {
        const QString day = age == 0 ? QStringLiteral("今天") : QStringLiteral("昨天");
        return day + shown.toString(QStringLiteral(" hh:mm"));
    }
    return shown.toString(QStringLiteral("yyyy/MM/dd hh:mm"));
}

QDate displayedToday()
{
    return QDateTime::currentDateTimeUtc().addSecs(kDisplayOffsetSeconds).date();
}

} // namespace zent

#include "notifymessages.h"

#include "filecontent.h"
#include "jsonreader.h"

#include <QDateTime>
#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

namespace zent
{

namespace
{

constexpr int kHttpsPort = 443;
/// The platform's users live at UTC+8, whatever zone the terminal is set to.
constexpr int kDisplayOffsetSeconds = 28800;

/// Nothing when a value is no text.
std::optional<NotifyMessage> messageFromJson(const QJsonValue& value)
{
    base::JsonReader reader(value);
    NotifyMessage message{reader.text("uuid"),   reader.text("uid"),     reader.text("send_uid"),
                          reader.text("title"),  reader.text("content"), reader.text("created_at"),
                          reader.text("read_at")};
    if (!reader.isGood())
        return std::nullopt;
    return message;
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
    config.token = object.value(QLatin1String("token")).toString();
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
    for (const QJsonValue& value : QJsonDocument::fromJson(body).array()) {
        if (const auto message = messageFromJson(value))
            messages.append(*message);
    }
    return messages;
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

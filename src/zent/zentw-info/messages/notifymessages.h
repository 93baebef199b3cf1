// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QDate>
#include <QList>
#include <QString>

#include <functional>
#include <optional>

/// One message of the notification service.
struct NotifyMessage {
    /// Identifier of the message, used to mark it read.
    QString uuid;
    /// Receiving user.
    QString uid;
    /// Sender.
    QString send_uid;
    QString title;
    QString content;
    /// Server time text, see QNotification::formatTime().
    QString created_at;
    QString read_at;
};

/// Parameters of a list request.
struct NotifyMessageOption {
    QString uid;
    bool is_not_read = false;
    int limit = 10;
    int offset = 0;
    QString order = QStringLiteral("create_at");
    QString desc = QStringLiteral("1");
};

/// Result of a list request.
struct NotifyMessageResponse {
    /// From the reply's headers; 0 where they are missing.
    int total = 0;
    int limit = 0;
    int offset = 0;
    /// Whether the request asked for unread messages only.
    bool is_not_read = false;
    QList<NotifyMessage> messages;
};

namespace zent
{

/// Where the notification service is and how the terminal proves itself to it.
struct NotifyConfig {
    QString protocol = QStringLiteral("http");
    QString host;
    int port = 10080;
    QString prefix = QStringLiteral("/notification/v2");
    QString token;

    /// The URL of one request kind: "list", "read" or "read_all".
    QString url(const QString& kind) const;
};

/// Reads the notification settings out of a terminal info file; nothing when it is not JSON.
std::optional<NotifyConfig> parseNotifyConfig(const QByteArray& infoFile);

/// The messages of a list reply in their order; none when the body is not a JSON array. A value that is missing or no
/// text reads as an empty one, and what is no object is left out.
QList<NotifyMessage> parseMessageList(const QByteArray& body);

/// Header of a reply by its name; empty where it is missing.
using HeaderLookup = std::function<QByteArray(const QByteArray& name)>;

/// A list reply's counts and messages. A header that is missing or no number counts as 0.
NotifyMessageResponse parseMessageReply(const HeaderLookup& header, const QByteArray& body);

/// A server time (UTC, ISO 8601) as it is shown, at UTC+8: "yyyy/MM/dd hh:mm". When `relative`, `today` and the day
/// before are "今天 hh:mm" and "昨天 hh:mm". Empty when the text is no time.
QString formatServerTime(const QString& serverTime, bool relative, const QDate& today);

/// Today at UTC+8.
QDate displayedToday();

} // namespace zent

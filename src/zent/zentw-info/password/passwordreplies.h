// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>

#include <optional>

/// Reading the answers about passwords: from bytes to a record, with nothing of widgets or logs in it.
namespace zent
{

/// The identity service's answer to a password change.
struct IdentityReply {
    /// A number that is no 32-bit integer.
    static constexpr int kUnknownCode = -1;
    /// 0 on success, also where the service sends something that is no number.
    int code = 0;
    QString message;
};

/// Nothing when the text is not a JSON object or has no code.
std::optional<IdentityReply> parseIdentityReply(const QString& text);

/// The management server's answer to a password change.
struct PasswordServerReply {
    int code = 0;
    /// The server's words about a failure.
    QString data;
    /// The renewed token; empty when the server sent none.
    QString token;
};

/// Nothing when the body is not a JSON object with a code.
std::optional<PasswordServerReply> parsePasswordServerReply(const QByteArray& body);

/// The least password length that a scene's configuration asks for: 0 when it names none, 8 when it asks for more than
/// 40 or for less than 0. Nothing when the file is not a JSON object or the length in it is no whole number.
std::optional<int> parseMinimumLength(const QByteArray& sceneConfig);

/// The least length where no configuration says otherwise.
constexpr int kDefaultMinimumLength = 8;

} // namespace zent

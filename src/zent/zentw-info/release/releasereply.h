// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>

namespace zent
{

/// What the server says of an administrator password.
struct ReleaseReply {
    enum class State {
        NotJson,
        Refused, ///< `message` holds the server's words
        Accepted,
    };
    State state = State::NotJson;
    QString message;
};

/// Accepted only with the code 0 and a result that is true.
ReleaseReply parseReleaseReply(const QByteArray& body);

} // namespace zent

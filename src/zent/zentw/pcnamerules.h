#pragma once

#include <QByteArray>
#include <QString>

#include <optional>

namespace zent
{

/// What the server says of a proposed terminal name.
struct PcNameVerdict {
    /// The reply held the code 0.
    bool accepted = false;
    QString message;
};

/// The reply of the name check; nothing when it is not a JSON object.
std::optional<PcNameVerdict> parsePcNameVerdict(const QByteArray& json);

/// The reply of the naming-rule request.
struct PcNameRule {
    enum class State {
        NotJson, ///< the reply or the rule text inside it is not JSON
        Refused, ///< the server answered with a code other than 0, or none
        Missing, ///< no rule in the reply
        Given,   ///< `expression` holds the rule; it may be empty
    };
    State state = State::NotJson;
    /// The parser's words, for State::NotJson.
    QString parseError;
    QString expression;
};

/// Reads the naming rule out of the reply, whose "message" is itself a JSON text.
PcNameRule parsePcNameRule(const QByteArray& json);

/// The rule without one leading and one trailing slash, as it may arrive as /pattern/.
QString withoutSlashes(const QString& rule);

} // namespace zent

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

/// Whether the rule may be compiled. The old regular expressions are matched without backtracking, but a few bytes
/// from the server could keep them compiling or looking ahead for hours, or overflow the stack: counted repetitions
/// multiply, and a group inside a group is a deeper call. Bounded are the length, the depth of groups, the number of
/// characters that is left when every counted repetition is written out (a reference back, and a character that is
/// looked ahead for, count many times), and looking ahead while looking ahead.
bool isBearableRule(const QString& rule);

/// What a naming rule finds in a name.
struct PcNameMatch {
    /// False when the rule is no regular expression, or not a bearable one; nothing is searched then.
    bool validRule = false;
    bool found = false;
    /// The match is the whole name.
    bool whole = false;
    QString text;
};

/// The first match of `rule`, case-sensitive and in the old syntax, in `name`.
PcNameMatch matchPcName(const QString& rule, const QString& name);

} // namespace zent

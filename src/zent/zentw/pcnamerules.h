// SPDX-License-Identifier: Apache-2.0
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

/// Whether the rule may be compiled: a few bytes from the server could otherwise keep the client busy for minutes. With
/// "a{1,3}" counted as three characters, a rule may have at most 512 characters and at most 32 choices: parts that may
/// be absent ("?", "*", "{0,n}") and alternatives ("|"). Repetitions stand within repetitions at most two deep. What
/// is looked ahead for counts 16 times, and as a repetition. References to groups ("\1") and unfinished
/// counts ("{3") are refused.
bool isBearableRule(const QString& rule);

/// What a naming rule matches of a name.
struct PcNameMatch {
    /// False when the rule is no regular expression, or not a bearable one; nothing is matched then.
    bool validRule = false;
    bool found = false;
    /// The match is the whole name.
    bool whole = false;
    QString text;
};

/// The longest match of `rule`, case-sensitive and in the old syntax, at the beginning of `name`. One that begins later
/// cannot be the whole name, and looking for it would start anew at every character.
PcNameMatch matchPcName(const QString& rule, const QString& name);

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
#include "pcnamerules.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <QRegExp>
#include <QRegularExpression>

#include <algorithm>

namespace zent
{

namespace
{

bool isSuccess(const QJsonObject& reply)
{
    return reply.value(QLatin1String("code")).toInt(-1) == 0;
}

/// A rule, or a part of it, with its counted repetitions written out: "a{1,3}" is three characters.
struct WrittenOut {
    int characters = 0;
    /// Parts that may be absent, and alternatives.
    int choices = 0;
    /// Of repetitions within repetitions.
    int depth = 0;
};

/// The steps of a match are bounded by characters × choices × the length of the name.
constexpr WrittenOut kMost{512, 32, 2};
/// A part for which the whole rule is refused.
constexpr WrittenOut kRefused{kMost.characters + 1, 0, 0};
/// What is looked ahead for is searched from many places, so it counts as repeated.
constexpr int kLookAheadTimes = 16;

WrittenOut operator+(const WrittenOut& a, const WrittenOut& b)
{
    return {std::min(a.characters + b.characters, kMost.characters + 1),
            std::min(a.choices + b.choices, kMost.choices + 1), std::max(a.depth, b.depth)};
}

WrittenOut repeated(const WrittenOut& part, int times)
{
    WrittenOut result{0, 0, part.depth + 1};
    for (int time = 0; time < std::min(std::max(times, 1), kMost.characters + 1); ++time)
        result = result + part;
    return result;
}

/// `part` with the quantifier behind it: "?", "*", "+", "{n}", "{n,}", "{n,m}" or "{,m}".
WrittenOut quantified(const WrittenOut& part, const QRegularExpressionMatch& quantifier)
{
    const QString sign = quantifier.captured();
    const int least = sign == QLatin1String("+") ? 1 : quantifier.captured(1).toInt();
    WrittenOut result = part;
    if (sign != QLatin1String("?"))
        result = repeated(part, std::max(least, quantifier.captured(2).toInt()));
    result.choices += least == 0 ? 1 : 0;
    return result;
}

/// The characters and groups up to the end of the rule or of the group that has just been opened.
WrittenOut readGroup(QRegularExpressionMatchIterator& tokens)
{
    WrittenOut before;
    WrittenOut last;
    while (tokens.hasNext()) {
        const QRegularExpressionMatch token = tokens.next();
        const QString text = token.captured();
        if (text == QLatin1String(")"))
            break;
        if (QStringLiteral("?*+{").contains(text.at(0))) {
            // QRegExp takes what follows an unfinished count for its "}", and compiles another rule than is read here.
            const bool isUnfinished = text.startsWith(QLatin1Char('{')) && !text.endsWith(QLatin1Char('}'));
            last = isUnfinished ? kRefused : quantified(last, token);
            continue;
        }
        before = before + last;
        if (text.startsWith(QLatin1Char('('))) {
            const WrittenOut group = readGroup(tokens);
            const bool looksAhead = text.endsWith(QLatin1Char('=')) || text.endsWith(QLatin1Char('!'));
            last = WrittenOut{group.characters == 0 ? 1 : 0, 0, 0} +
                   (looksAhead ? repeated(group, kLookAheadTimes) : group);
        } else if (text == QLatin1String("|")) {
            last = {0, 1, 0};
        } else if (text.size() == 2 && text.at(1) >= QLatin1Char('1') && text.at(1) <= QLatin1Char('9')) {
            // A reference to a group: QRegExp reads places that it has never written for some, and crashes.
            last = kRefused;
        } else {
            const bool isAnchor = text == QLatin1String("^") || text == QLatin1String("$");
            last = {isAnchor ? 0 : 1, 0, 0};
        }
    }
    return before + last;
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

bool isBearableRule(const QString& rule)
{
    // An escaped character, a class, the beginning of a group, a counted repetition, or any one character.
    static const QRegularExpression kToken(
        QStringLiteral(R"(\\.|\[\^?(?:\\.|.)(?:\\.|[^\]\\])*\]|\(\?[:=!]|\{(\d*)(?:,(\d*))?\}?|.)"),
        QRegularExpression::DotMatchesEverythingOption);
    if (rule.size() > kMost.characters)
        return false;
    WrittenOut whole;
    for (QRegularExpressionMatchIterator tokens = kToken.globalMatch(rule); tokens.hasNext();)
        whole = whole + readGroup(tokens);
    return whole.characters <= kMost.characters && whole.choices <= kMost.choices && whole.depth <= kMost.depth;
}

PcNameMatch matchPcName(const QString& rule, const QString& name)
{
    PcNameMatch match;
    if (!isBearableRule(rule) || !QRegExp(rule).isValid())
        return match;
    match.validRule = true;
    const QRegExp expression(QStringLiteral("^(?:%1)").arg(rule), Qt::CaseSensitive);
    match.found = expression.indexIn(name) == 0;
    match.whole = match.found && expression.matchedLength() == name.length();
    match.text = match.found ? expression.cap() : QString();
    return match;
}

} // namespace zent

#include "pcnamerules.h"

#include <QJsonDocument>
#include <QJsonObject>
#include <QRegExp>

#include <algorithm>
#include <vector>

namespace zent
{

namespace
{

bool isSuccess(const QJsonObject& reply)
{
    return reply.value(QLatin1String("code")).toInt(-1) == 0;
}

/// Far above any rule for names of at most 255 characters; rules at the limits have taken up to a second.
constexpr int kMaxRuleLength = 1024;
constexpr int kMaxRuleDepth = 32;
constexpr int kMaxWrittenOut = 400;
constexpr int kLookAheadWeight = 8;
constexpr int kBackReferenceWeight = 40;

/// Walks over a rule and counts what compiling it would make of it. Where it is unsure it counts too much.
class RuleMeasure
{
public:
    explicit RuleMeasure(const QString& rule) : m_rule(rule) {}

    bool isBearable()
    {
        for (m_at = 0; m_at < m_rule.size(); ++m_at) {
            if (!step())
                return false;
            if (m_groups.size() > kMaxRuleDepth || m_groups.front().sum > kMaxWrittenOut)
                return false;
        }
        while (m_groups.size() > 1)
            closeGroup();
        return m_groups.front().sum <= kMaxWrittenOut;
    }

private:
    struct Group {
        /// Characters in the group, and how many of them the last item has; a repetition multiplies those.
        int sum = 0;
        int last = 0;
        bool looksAhead = false;
    };

    QChar at(int index) const { return index < m_rule.size() ? m_rule.at(index) : QChar(); }

    bool step()
    {
        switch (m_rule.at(m_at).unicode()) {
        case '(':
            return openGroup();
        case ')':
            if (m_groups.size() > 1)
                closeGroup();
            return true;
        case '{':
            repeat();
            return true;
        case '[':
            skipClass();
            break;
        case '\\':
            ++m_at;
            // A reference back is compared anew on every way to it.
            add(at(m_at).isDigit() ? kBackReferenceWeight : characterWeight());
            return true;
        case '*':
        case '+':
        case '?':
            return true;
        default:
            break;
        }
        add(characterWeight());
        return true;
    }

    /// What is looked ahead for is searched again from every character of the name.
    int characterWeight() const { return m_groups.back().looksAhead ? kLookAheadWeight : 1; }

    bool openGroup()
    {
        const bool looksAhead =
            at(m_at + 1) == QLatin1Char('?') && (at(m_at + 2) == QLatin1Char('=') || at(m_at + 2) == QLatin1Char('!'));
        const bool within = m_groups.back().looksAhead;
        m_groups.push_back({0, 0, looksAhead || within});
        return !(looksAhead && within);
    }

    void closeGroup()
    {
        const int size = m_groups.back().sum;
        m_groups.pop_back();
        add(std::max(size, 1));
    }

    void add(int size)
    {
        m_groups.back().last = size;
        m_groups.back().sum = std::min(m_groups.back().sum + size, kMaxWrittenOut + 1);
    }

    /// Takes the largest number of "{n}", "{n,}" or "{n,m}"; without a closing brace the rule is invalid anyway.
    void repeat()
    {
        int times = 1;
        int number = 0;
        for (++m_at; m_at < m_rule.size() && m_rule.at(m_at) != QLatin1Char('}'); ++m_at) {
            const int digit = m_rule.at(m_at).digitValue();
            number = digit < 0 ? 0 : std::min(number * 10 + digit, kMaxWrittenOut + 1);
            times = std::max(times, number);
        }
        const int last = m_groups.back().last;
        m_groups.back().sum -= last;
        add(std::min(last * times, kMaxWrittenOut + 1));
    }

    /// Leaves `m_at` on the closing bracket. The first character never closes the class.
    void skipClass()
    {
        if (at(++m_at) == QLatin1Char('^'))
            ++m_at;
        do {
            if (at(m_at) == QLatin1Char('\\'))
                ++m_at;
            ++m_at;
        } while (m_at < m_rule.size() && m_rule.at(m_at) != QLatin1Char(']'));
    }

    const QString& m_rule;
    int m_at = 0;
    std::vector<Group> m_groups = std::vector<Group>(1);
};

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
    return rule.size() <= kMaxRuleLength && RuleMeasure(rule).isBearable();
}

PcNameMatch matchPcName(const QString& rule, const QString& name)
{
    PcNameMatch match;
    if (!isBearableRule(rule))
        return match;
    const QRegExp expression(rule, Qt::CaseSensitive);
    match.validRule = expression.isValid();
    match.found = match.validRule && expression.indexIn(name) >= 0;
    match.whole = match.found && expression.matchedLength() == name.length();
    match.text = match.found ? expression.cap() : QString();
    return match;
}

} // namespace zent

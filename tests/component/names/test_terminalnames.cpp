// SPDX-License-Identifier: Apache-2.0
#include "pcnamerules.h"

#include <QRandomGenerator>
#include <QtTest>

#include <ctime>

namespace
{

constexpr int kLongestName = 255;

/// Processor time: the machine may be busy with something else.
double millisecondsSpent()
{
    timespec now{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

/// A rule and a name that fits it.
struct Sample {
    QString rule;
    QString name;
};

class SampleMaker
{
public:
    explicit SampleMaker(int seed) : m_random(static_cast<quint32>(seed)) {}

    /// A rule that is let through, with a name of 255 characters.
    Sample make()
    {
        Sample sample;
        do {
            sample = group(3);
            const int left = kLongestName - sample.name.size();
            if (left > 0)
                sample = joined(sample, {pick({"[a-z0-9-]{1,255}", "[^!]+", "(\\w|-)*"}), QString(left, 'z')});
            if (pick(2) == 0)
                sample.rule = pick({"^", "^(?!-)", "^(?=[a-z])"}) + sample.rule + '$';
        } while (sample.name.size() != kLongestName || !zent::isBearableRule(sample.rule));
        return sample;
    }

private:
    int pick(int bound) { return m_random.bounded(bound); }
    QString pick(std::initializer_list<const char*> texts)
    {
        return QString::fromUtf8(texts.begin()[pick(static_cast<int>(texts.size()))]);
    }
    static Sample joined(const Sample& a, const Sample& b) { return {a.rule + b.rule, a.name + b.name}; }
    Sample part(int depth)
    {
        Sample result{pick({"a", ".", "[a-z0-9]", "[^-]", "(a|b|.)", "(?:x|a?)"}), "a"};
        if (depth > 0 && pick(2) == 0) {
            result = group(depth - 1);
            result.rule = '(' + result.rule + ')';
        }
        return result;
    }
    Sample group(int depth)
    {
        Sample result;
        for (int parts = 1 + pick(4); parts > 0; --parts) {
            const Sample one = part(depth);
            const int most = 1 << pick(8);
            const int times = 1 + pick(most);
            const QString counted = QString("{%1,%2}").arg(pick(2)).arg(most);
            const QString quantifier = times == 1 ? pick({"", "?", "*", "+"}) : pick(2) ? counted : pick({"*", "+"});
            result = joined(result, {one.rule + quantifier, one.name.repeated(times)});
        }
        return result;
    }

    QRandomGenerator m_random;
};

} // namespace

/// The time that the naming rules of a server take.
class TestTerminalNames : public QObject
{
    Q_OBJECT

private slots:
    void bearableRules()
    {
        const std::pair<QString, bool> rows[] = {
            {QString(512, 'a'), true}, {QString(513, 'a'), false}, {"a{512}", true},
            {"a{513}", false},         {"a{2,513}", false},        {"a{,513}", false},
            {"a{513,}", false},        {"a{513", false},           {"(?:a{255}b){2}", true},
            {"(a{255}bc){2}", false},  {"(a?){1,32}", true},       {"(a?){1,33}", false},
            {"(a{0,1}){32}", true},    {"(a{0,1}){33}", false},    {"(a|b){32}", true},
            {"(a|b){33}", false},      {"(a+){33}", true},         {"(a*)*", true},
            {"((a*)*)*", false},       {"((a+){2})?", true},       {"((a+){2})+", false},
            {"(?=a{32})", true},       {"(?=a{33})", false},       {"(?!a{33})", false},
            {"(?=(a*)*)", false},      {"(?:a{33})", true},        {"[^]a*+?|(]{512}", true},
            {"[a\\]b]{513}", false},   {"\\{{512}", true},         {"(a)\\1", false},
            {"(a)\\0", true},          {"(a)[\\1]", true},         {"^^^$$$a{512}", true},
            {"()()a{511}", false},     {"()(a{511})", true},       {"a{511}b", true}};
        for (const auto& [rule, bearable] : rows)
            QVERIFY2(zent::isBearableRule(rule) == bearable, qPrintable(rule));
    }

    void generatedRules()
    {
        for (int seed = 0; seed < 200; ++seed) {
            const Sample sample = SampleMaker(seed).make();
            const QString nearly = sample.name.left(kLongestName - 1) + '!';
            const double began = millisecondsSpent();
            const zent::PcNameMatch match = zent::matchPcName(sample.rule, sample.name);
            const double between = millisecondsSpent();
            zent::matchPcName(sample.rule, nearly);
            const double ended = millisecondsSpent();
            QVERIFY2(match.whole, qPrintable(sample.rule + '\n' + sample.name));
            const double longest = std::max(between - began, ended - between);
            QVERIFY2(longest < 100, qPrintable(QString("%1 ms: %2").arg(longest).arg(sample.rule)));
        }
    }
};

QTEST_GUILESS_MAIN(TestTerminalNames)
#include "test_terminalnames.moc"

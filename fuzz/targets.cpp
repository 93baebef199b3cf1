// SPDX-License-Identifier: Apache-2.0
#include "targets.h"

#include "activeconnections.h"
#include "baseutils.h"
#include "displaytext.h"
#include "filecontent.h"
#include "gates.h"
#include "notifymessages.h"
#include "passwordreplies.h"
#include "pcnamerules.h"
#include "releasereply.h"
#include "replies.h"
#include "terminalinfo.h"
#include "texttargets.h"

#include <QJsonDocument>
#include <QRegExp>
#include <QStringList>

#include <cstdio>
#include <cstdlib>
#include <ctime>

namespace fuzz
{

namespace
{

/// What every reply holds when it is believed, read without the parsers under test.
QJsonObject objectOf(const QByteArray& input)
{
    return QJsonDocument::fromJson(input).object();
}

bool saysSuccess(const QByteArray& input)
{
    const QJsonValue code = objectOf(input).value(QLatin1String("code"));
    return code.isDouble() && code.toDouble() == 0;
}

/// A byte of input never makes more than one character of a record.
void requireBounded(const QStringList& texts, const QByteArray& input)
{
    int size = 0;
    for (const QString& text : texts)
        size += text.size();
    require(size <= input.size(), "the texts are no longer than the input");
}

/// What is sent back, written or compared is whole or not there.
void requireIdentifier(const QString& text)
{
    require(text.size() <= 1000, "a longer text is no identifier");
}

template <typename T>
void requireState(const zent::Reply<T>& reply, const QByteArray& input)
{
    require(!reply.isGood() || saysSuccess(input), "a good reply has the code 0");
    const bool isJson = !QJsonDocument::fromJson(input).isNull();
    require((reply.state == zent::ReplyState::NotJson) == !isJson, "NotJson is what is no JSON");
}

QString parseUser(const QByteArray& input)
{
    const auto reply = zent::parseUserReply(input);
    const zent::UserData& user = reply.value;
    requireState(reply, input);
    require(reply.isGood() || (user.id == 0 && user.permissions.isEmpty()), "nothing of a bad reply is kept");
    require(!user.gecosFirst.contains(',') && !user.gecosLast.contains(','), "the parts of gecos hold no comma");
    const QStringList texts{user.gecosFirst, user.gecosLast, user.groupName, user.clientName};
    // gecos counts twice where it is one part.
    requireBounded({user.gecosFirst, user.groupName, user.clientName}, input);
    require(reply.isGood() || texts.join(QString()).isEmpty(), "no text of a bad reply is kept");
    return texts.join('|') + QString::number(user.id);
}

QString parseNames(const QByteArray& input)
{
    const auto organisation = zent::parseOrganisationReply(input);
    const auto area = zent::parseAreaReply(input);
    requireState(organisation, input);
    requireState(area, input);
    require(!(organisation.isGood() && area.isGood()), "no reply is both an organisation and an area");
    require(organisation.isGood() || organisation.value.isEmpty(), "no name of a bad organisation reply is kept");
    require(area.isGood() || area.value.isEmpty(), "no name of a bad area reply is kept");
    requireBounded({organisation.value, area.value}, input);
    return organisation.value + '|' + area.value;
}

QString parseScenes(const QByteArray& input)
{
    const auto reply = zent::parseSceneReply(input);
    requireState(reply, input);
    const int elements = objectOf(input).value(QLatin1String("message")).toArray().size();
    require(static_cast<int>(reply.value.size()) == (reply.isGood() ? elements : 0), "every element is a scene");
    QStringList texts;
    for (const zent::Scene& scene : reply.value) {
        requireIdentifier(scene.code);
        texts << scene.name << scene.code;
    }
    requireBounded(texts, input);
    return texts.join('|');
}

QString parseMessages(const QByteArray& input)
{
    const QList<NotifyMessage> messages = zent::parseMessageList(input);
    require(messages.size() <= QJsonDocument::fromJson(input).array().size(), "an element is one message at most");
    QStringList texts;
    for (const NotifyMessage& message : messages) {
        requireIdentifier(message.uuid);
        texts << message.uuid << message.uid << message.send_uid << message.title << message.content
              << message.created_at << message.read_at;
    }
    requireBounded(texts, input);
    return texts.join('|');
}

/// A server time, in UTF-8.
QString parseTimes(const QByteArray& input)
{
    const QString text = QString::fromUtf8(input);
    const QDate today(2026, 11, 25);
    const QString absolute = zent::formatServerTime(text, false, today);
    const QString relative = zent::formatServerTime(text, true, today);
    require(absolute.isEmpty() || QRegExp("-?\\d{4,}/\\d\\d/\\d\\d \\d\\d:\\d\\d").exactMatch(absolute),
            "a time is shown whole or not at all");
    require(absolute.isEmpty() == relative.isEmpty(), "a time is one in both forms or in none");
    require(relative == absolute || absolute.endsWith(relative.right(6)), "both forms show the same minute");
    return absolute + '|' + relative;
}

QString parseNotifySettings(const QByteArray& input)
{
    const auto config = zent::parseNotifyConfig(input);
    require(config.has_value() == !QJsonDocument::fromJson(input).isNull(), "settings come from JSON only");
    if (!config)
        return QString();
    const QString url = config->url(QStringLiteral("list"));
    require(url.endsWith("/list"), "the URL ends in the request kind");
    requireBounded({config->host, config->token}, input);
    requireIdentifier(config->token);
    return url + '|' + config->token;
}

QString parseConnections(const QByteArray& input)
{
    const auto array = zent::parseConnectionArray(input);
    if (!array)
        return QString();
    const auto connections = zent::primaryConnections(*array);
    const auto hwAddress = zent::primaryHwAddress(*array);
    require(!connections || connections->empty() == !hwAddress, "an address comes from a primary connection");
    QStringList texts(hwAddress.value_or(QString()));
    if (!connections)
        return texts.first();
    require(static_cast<int>(connections->size()) <= array->size(), "an element is one connection at most");
    require(connections->empty() || connections->front().hwAddress == *hwAddress, "the first one's address");
    texts.clear();
    for (const zent::ActiveConnection& connection : *connections)
        texts << connection.hwAddress << connection.speed << connection.address << connection.mask << connection.gateway
              << connection.dns;
    requireBounded(texts, input);
    return texts.join('|');
}

QString parseNamingRule(const QByteArray& input)
{
    const zent::PcNameRule rule = zent::parsePcNameRule(input);
    const bool given = rule.state == zent::PcNameRule::State::Given;
    require(given || rule.expression.isEmpty(), "a rule comes from a good reply only");
    require(!given || saysSuccess(input), "a given rule has the code 0");
    require((rule.state == zent::PcNameRule::State::NotJson) == !rule.parseError.isEmpty(), "a reason where not JSON");
    const QString stripped = zent::withoutSlashes(rule.expression);
    require(rule.expression.contains(stripped) && rule.expression.size() - stripped.size() <= 2, "two slashes at most");
    const auto verdict = zent::parsePcNameVerdict(input);
    require(!verdict || verdict->accepted == saysSuccess(input), "a name is accepted with the code 0 only");
    return rule.expression + '|' + (verdict ? verdict->message : QString());
}

/// A text as it is shown, at the limits that there are and at one that short inputs reach.
QString displayText(const QByteArray& input)
{
    using namespace zent::display;
    const QString text = QString::fromUtf8(input);
    QString shown;
    for (const int length : {1, 7, kSceneNameLength, kValueLength, kContentLength}) {
        shown = cut(text, length);
        require(shown.size() <= length + 1, "no more is shown than the limit and the sign of a cut");
        require((shown == text) == (text.size() <= length) || text.size() == length + 1, "only what is long is cut");
        require(text.size() <= length || text.startsWith(shown.chopped(1)), "the beginning is shown");
        require(text.size() <= length || shown.size() < 2 || !shown.at(shown.size() - 2).isHighSurrogate(),
                "no character is cut in two");
    }
    return shown;
}

/// Processor time: the machine may be busy with something else.
double secondsSpent()
{
    timespec now{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) / 1e9;
}

/// A rule and, after the first line feed, a name.
QString matchNames(const QByteArray& input)
{
    constexpr int kLongestName = 255;
    constexpr double kMostSeconds = 5;
    const int split = input.indexOf('\n');
    const QString rule = QString::fromUtf8(input.left(split));
    const QString name = split < 0 ? QString() : QString::fromUtf8(input.mid(split + 1)).left(kLongestName);
    const double began = secondsSpent();
    const zent::PcNameMatch match = zent::matchPcName(rule, name);
    require(secondsSpent() - began < kMostSeconds, "no rule keeps the window waiting");
    require(!match.found || match.validRule, "only a valid rule finds something");
    require(!match.whole || (match.found && match.text == name), "a whole match is the whole name");
    require(name.contains(match.text), "what was found is in the name");
    require(!match.whole || QRegExp(rule).exactMatch(name), "a name that passes is matched from end to end");
    return match.text;
}

QString parseTerminalInfo(const QByteArray& input)
{
    namespace key = zent::base::infokey;
    const auto object = zent::base::parseInfoObject(input);
    require(object.has_value() == QJsonDocument::fromJson(input).isObject(), "terminal info is one JSON object");
    require(!zent::saysInDomain(input) || (object && object->value(key::kIsDomain).isBool()), "only true is true");
    if (!object)
        return QString();
    QStringList texts;
    for (const QString& wanted : {key::kServerHost, key::kServerPort, key::kDomainHost, key::kTerminalName}) {
        QString text;
        const bool found = zent::base::BaseUtils::getJsonObjectValue(*object, wanted, text, QString());
        require(found == object->contains(wanted), "a key is found where it is");
        texts << text;
    }
    requireBounded(texts, input);
    return texts.join('|');
}

/// A version file, in UTF-8.
QString parseVersionFile(const QByteArray& input)
{
    const int version = zent::minorVersionIn(QString::fromUtf8(input));
    require(version == -1 || input.contains("MinorVersion"), "a version needs its key");
    return QString::number(version);
}

QString parsePasswordPolicy(const QByteArray& input)
{
    const auto length = zent::parseMinimumLength(input);
    require(!length || (*length >= 0 && *length <= 40), "the least length is from 0 to 40");
    return QString::number(length.value_or(-1));
}

QString parsePasswordAnswers(const QByteArray& input)
{
    const auto identity = zent::parseIdentityReply(QString::fromUtf8(input));
    require(!identity || identity->code != 0 || objectOf(QString::fromUtf8(input).toUtf8()).contains("code"),
            "a success has a code");
    const auto server = zent::parsePasswordServerReply(input);
    require(!server || objectOf(input).value("code").isDouble(), "the server's code is a number");
    require(!server || server->code != 0 || saysSuccess(input), "a success has the code 0");
    const QStringList texts{identity ? identity->message : QString(), server ? server->data : QString(),
                            server ? server->token : QString()};
    requireBounded(texts, input);
    return texts.join('|');
}

QString parseRelease(const QByteArray& input)
{
    using State = zent::ReleaseReply::State;
    const zent::ReleaseReply reply = zent::parseReleaseReply(input);
    const QJsonValue result = objectOf(input).value("data").toObject().value("result");
    const bool granted = saysSuccess(input) && result.isBool() && result.toBool();
    require((reply.state == State::Accepted) == granted, "released with the code 0 and a true result only");
    require(reply.state == State::Refused || reply.message.isEmpty(), "only a refusal has words");
    return reply.message;
}

const Target* s_running = nullptr;

} // namespace

const std::vector<Target>& targets()
{
    static const std::vector<Target> all{
        {"user", parseUser},
        {"names", parseNames},
        {"scenes", parseScenes},
        {"messages", parseMessages},
        {"times", parseTimes},
        {"notifysettings", parseNotifySettings},
        {"connections", parseConnections},
        {"namingrule", parseNamingRule},
        {"namematch", matchNames},
        {"terminalinfo", parseTerminalInfo},
        {"versionfile", parseVersionFile},
        {"passwordpolicy", parsePasswordPolicy},
        {"passwordanswers", parsePasswordAnswers},
        {"release", parseRelease},
        {"display", displayText},
        {"fileconfig", readFileConfig},
        {"migration", migrateUserInfo},
        {"logtexts", logTexts},
        {"urls", buildUrls},
        {"counts", countMessages},
    };
    return all;
}

const Target* findTarget(const QByteArray& name)
{
    for (const Target& target : targets()) {
        if (name == target.name)
            return &target;
    }
    return nullptr;
}

void require(bool holds, const char* rule)
{
    if (holds)
        return;
    std::fprintf(stderr, "%s: does not hold: %s\n", s_running ? s_running->name : "", rule);
    std::abort();
}

void run(const Target& target, const QByteArray& input)
{
    s_running = &target;
    require(target.parse(input) == target.parse(input), "the same input gives the same result");
}

} // namespace fuzz

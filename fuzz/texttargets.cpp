// SPDX-License-Identifier: Apache-2.0
#include "texttargets.h"

#include "fileconfig.h"
#include "filecontent.h"
#include "httprules.h"
#include "log.h"
#include "notifymessages.h"
#include "targets.h"
#include "urlquery.h"

#include <QDebug>
#include <QFile>
#include <QJsonDocument>
#include <QUrlQuery>

#include <cstdlib>

#include <sys/mman.h>

namespace fuzz
{

namespace
{

/// A file without a place, so that nothing is left behind when the process ends at any point.
class MemoryFile
{
public:
    explicit MemoryFile(const QByteArray& content)
    {
        require(m_file.open(memfd_create("fuzz", MFD_CLOEXEC), QIODevice::ReadWrite, QFileDevice::AutoCloseHandle) &&
                    m_file.write(content) == content.size() && m_file.flush(),
                "the file can be made");
    }
    QString path() const { return QStringLiteral("/proc/self/fd/%1").arg(m_file.handle()); }

private:
    QFile m_file;
};

QStringList textsOf(const zent::base::UserInfo& info)
{
    return {info.serverHost, info.serverPort,   info.domainHost,
            info.domainPort, info.terminalName, info.isDomain ? QStringLiteral("1") : QString()};
}

void requireOneRecord(const QString& message)
{
    const QMessageLogContext context("a/b.cpp", 7, "f()", "default");
    const QByteArray record = zent::logRecord(QtWarningMsg, context, message);
    require(record.startsWith("warning [ b.cpp f() 7]  ") && record.endsWith(" \n"), "a record is whole");
    require(record.count('\n') == 1 && !record.contains('\r') && !record.contains('\0'), "a record is one line");
}

QString debugForm(const QUrl& url)
{
    QString form;
    QDebug(&form) << url;
    return form;
}

/// What no server's address may be given by a text from elsewhere.
void requireOfServer(const QUrl& url, const QString& port)
{
    require(url.scheme() == "https" && url.userInfo().isEmpty() && !url.hasQuery() && !url.hasFragment(),
            "only host and port come from the file");
    require(!url.isValid() || url.path() == "/uim/v3", "the path is what was asked for");
    require(!url.isValid() || url.port() == port.toInt(), "the port is the file's");
    requireOneRecord(debugForm(url));
}

} // namespace

QString readFileConfig(const QByteArray& input)
{
    FileConfig* config = FileConfig::GetInstance();
    const QString before = QStringLiteral("before");
    config->setServerHost(before);
    config->setServerPort(before);
    config->setDomainHost(before);
    config->setDomainPort(before);
    config->setTerminalName(before);
    config->setIsDomain(true);
    config->readServerConfig(MemoryFile(input).path());
    const QStringList texts{config->readServerHost(), config->readServerPort(), config->readDomainHost(),
                            config->readDomainPort(), config->readTerminalName()};
    const bool kept = texts.count(before) == texts.size() && config->readIsDomain();
    require(!QJsonDocument::fromJson(input).isNull() || kept, "what is no JSON changes nothing");
    require(kept || texts.join(QString()).size() <= input.size(), "the texts are no longer than the input");
    const QUrl server = config->getServerUrl(QStringLiteral("/uim/v3"));
    const QUrl domain = config->getDomainUrl(QStringLiteral("/uim/v3"));
    requireOfServer(server, texts.at(1));
    requireOfServer(domain, texts.at(3));
    return texts.join('|') + server.toString() + domain.toString();
}

QString migrateUserInfo(const QByteArray& input)
{
    // Qt drops a byte order mark from the start of a text that it writes, so what is read back may have another key.
    if (input.contains("\xEF\xBB\xBF") || input.toLower().contains("\\ufeff"))
        return QString();
    const QJsonObject object = zent::base::parseInfoObject(input).value_or(QJsonObject());
    const zent::base::UserInfoReading first = zent::base::readUserInfo(object, QString());
    QJsonObject written = object;
    for (const auto& [key, value] : first.migrated) {
        require(!object.contains(key), "what is there is not replaced");
        written.insert(key, value);
    }
    const auto readBack = zent::base::parseInfoObject(QJsonDocument(written).toJson());
    require(readBack.has_value(), "what is written can be read");
    const zent::base::UserInfoReading second = zent::base::readUserInfo(*readBack, QString());
    const QStringList texts = textsOf(first.info);
    require(textsOf(second.info) == texts, "the record stays the same");
    require(second.complete == first.complete && second.migrated.empty(), "a file is migrated once");
    require(readBack->size() == object.size() + static_cast<int>(first.migrated.size()), "no other key comes or goes");
    return texts.join('|');
}

QString logTexts(const QByteArray& input)
{
    const QString text = QString::fromUtf8(input);
    QString quoted;
    QDebug(&quoted) << text;
    requireOneRecord(quoted);
    requireOneRecord(debugForm(QUrl(text)));
    requireOneRecord(zent::http::logUrl(QUrl(text)));
    // A message that was not quoted may have lines of its own, and ends where C ends it.
    const QByteArray record = zent::logRecord(QtFatalMsg, QMessageLogContext(), text);
    require(record == "fata [   0]  " + QByteArray(text.toLocal8Bit().constData()) + " \n", "a record holds its text");
    return quoted;
}

QString buildUrls(const QByteArray& input)
{
    const int split = input.indexOf('\n');
    const QUrl base(QString::fromUtf8(input.left(split)));
    const QString value = split < 0 ? QString() : QString::fromUtf8(input.mid(split + 1));
    const QUrl url = zent::withQuery(base, {{QStringLiteral("uid"), value}, {QStringLiteral("limit"), "1"}});
    requireOneRecord(debugForm(url));
    require(url.host() == base.host(), "the host is the address's");
    // To set a query makes a URL valid that had no valid host; what has none is not sent.
    if (!url.isValid() || !base.isValid())
        return url.toString();
    require(url.adjusted(QUrl::RemoveQuery) == base.adjusted(QUrl::RemoveQuery), "only the query is set");
    const auto items = QUrlQuery(url).queryItems(QUrl::FullyEncoded);
    require(items.size() == 2 && items.last().second == "1", "a value adds nothing to the query");
    // Decoded by the byte, as a server does it; Qt's own decoding leaves noncharacters encoded.
    const QByteArray arrived = QByteArray::fromPercentEncoding(items.first().second.toLatin1());
    require(arrived == value.toUtf8(), "the value arrives as it was");
    const QString logged = zent::http::logUrl(url);
    require(!logged.contains("uid=") || base.toString(QUrl::RemoveQuery | QUrl::RemoveFragment).contains("uid="),
            "the log holds no query");
    require(QUrl(logged).userInfo().isEmpty(), "the log holds no credentials");
    return url.toString() + logged;
}

QString countMessages(const QByteArray& input)
{
    QList<QByteArray> lines = input.split('\n');
    while (lines.size() < 4)
        lines.append(QByteArray());
    const QByteArray body = lines.mid(3).join('\n');
    const auto header = [&lines](const QByteArray& name) {
        return lines.at(name == "X-Total-Count" ? 0 : name == "X-Total-Limit" ? 1 : 2);
    };
    const NotifyMessageResponse response = zent::parseMessageReply(header, body);
    const int counts[] = {response.total, response.limit, response.offset};
    for (int index = 0; index < 3; ++index) {
        const QByteArray digits = QByteArray::number(std::abs(qint64(counts[index])));
        require(counts[index] == 0 || lines.at(index).contains(digits), "a count is the header's");
    }
    require(response.messages.size() == zent::parseMessageList(body).size(), "the counts leave the messages alone");
    return QStringLiteral("%1/%2/%3/%4").arg(counts[0]).arg(counts[1]).arg(counts[2]).arg(response.messages.size());
}

} // namespace fuzz

#pragma once

#include <QJsonObject>
#include <QObject>
#include <QString>

#include <optional>

namespace zent::base
{

/// Keys of the terminal info file that this store reads and writes.
namespace infokey
{
inline const QString kIsDomain = QStringLiteral("is_Domain");
inline const QString kServerHost = QStringLiteral("server_host");
inline const QString kServerPort = QStringLiteral("server_port");
/// Older name of the domain host, read only to migrate it.
inline const QString kServerIp = QStringLiteral("server_ip");
inline const QString kDomainHost = QStringLiteral("domain_host");
inline const QString kDomainPort = QStringLiteral("domain_port");
inline const QString kTerminalName = QStringLiteral("terminal_name");
} // namespace infokey

/// What the terminal info file says.
struct UserInfo {
    bool isDomain = false;
    QString serverHost;
    QString serverPort;
    QString domainHost;
    QString domainPort;
    QString terminalName;
};

/// The terminal info file's object, or nothing when `content` is not one JSON object.
std::optional<QJsonObject> parseInfoObject(const QByteArray& content);

/// Changes one key of the terminal info file, adding it when absent. False when the file cannot be opened, is not
/// one JSON object (it is then left as it is) or cannot be written. Instantiated for QString.
template <typename T>
bool updateUserInfo(const QString& key, const T& value);

/// The terminal's own state: the terminal info file and the machine identifier. Every call reads the file anew.
/// Each `ok` may be null; it is set to false when the file or a wanted key could not be read.
class FileContent : public QObject
{
    Q_OBJECT

public:
    /// The one instance, made on first use.
    static FileContent* instace();

    /// The machine identifier without surrounding white space; empty when its file cannot be read. The second flag
    /// has no meaning on this platform.
    QString getMachineID(bool* ok, bool);

    /// Whether the terminal has joined the domain.
    bool isDomain(bool* ok);

    /// Stores whether the terminal is in the domain. The key must already be in the file; an equal value is not
    /// written again. False on any failure.
    bool saveDomain(bool value);

    /// Host and port of the management server; false when either could not be read.
    bool getHostAndPort(QString& host, QString& port);

    /// The terminal's alias as registered with the server.
    QString getTerminalAlias(bool* ok);

    /// The whole record. A file of the older form is migrated to "domain_host" and "domain_port" on first read.
    UserInfo getUserInfo(bool* ok);

    /// Replaces the file by the record; false on any failure.
    bool saveUserInfo(const UserInfo& info);

private:
    FileContent() = default;
};

} // namespace zent::base

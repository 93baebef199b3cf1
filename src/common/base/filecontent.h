// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "terminalinfo.h"

#include <QObject>
#include <QString>

#include <utility>
#include <vector>

namespace zent::base
{

/// What the terminal info file says.
struct UserInfo {
    bool isDomain = false;
    QString serverHost;
    QString serverPort;
    QString domainHost;
    QString domainPort;
    QString terminalName;
};

/// What came of reading a record out of an object.
struct UserInfoReading {
    UserInfo info;
    /// Whether no wanted key was missing.
    bool complete = true;
    /// Keys that a file of the older form lacks, with the values that it has under their older names.
    std::vector<std::pair<QString, QString>> migrated;
};

/// Reads the record; `caller` is named in the log line about each missing key.
UserInfoReading readUserInfo(const QJsonObject& object, const QString& caller);

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
    /// is not used.
    QString getMachineID(bool* ok, bool);

    /// Host and port of the management server; false when either could not be read.
    bool getHostAndPort(QString& host, QString& port);

private:
    FileContent() = default;

    // Agreed with other components, and called by them only.
public:
    /// Whether the terminal has joined the domain.
    bool isDomain(bool* ok);
    /// Stores whether the terminal is in the domain. The key must already be in the file; an equal value is not
    /// written again. False on any failure.
    bool saveDomain(bool value);
    /// The terminal's alias as registered with the server.
    QString getTerminalAlias(bool* ok);
    /// The whole record. A file of the older form is migrated to "domain_host" and "domain_port" on first read.
    UserInfo getUserInfo(bool* ok);
    /// Replaces the file by the record; false on any failure.
    bool saveUserInfo(const UserInfo& info);
};

} // namespace zent::base

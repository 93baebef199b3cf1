// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QObject>
#include <QString>
#include <QUrl>

/// Where the management server and the domain service are, what this terminal is called and whether it is in the
/// domain. Loaded once from the terminal info file; the setters change only the object.
class FileConfig : public QObject
{
    Q_OBJECT

public:
    /// The one instance, made on first use.
    static FileConfig* GetInstance();

    QString readTerminalName() const { return m_terminalName; }

    void setIsDomain(const bool& isDomain) { m_isDomain = isDomain; }

    /// The HTTPS address of `path` on the management server. A port text that is no number gives port 0.
    QUrl getServerUrl(const QString& path) const;
    /// The same on the domain service.
    QUrl getDomainUrl(const QString& path) const;

    /// Loads the fields from the terminal info file at `path`. Without a readable file only the terminal name is set,
    /// to the host name; a file that is not JSON changes nothing.
    void readServerConfig(const QString& path);

    /// Writes the fields to the staging copy below the temporary directory. Failures are logged.
    void writeServerConfig();

    /// The host name from the desktop's file, without line feeds; empty when it cannot be read.
    QString readHostName() const;

    /// The hardware address of the primary connection; empty without one or without the network daemon.
    QString getMacAddress() const;

private:
    FileConfig();

    QString m_serverHost;
    QString m_domainHost;
    QString m_domainPort;
    QString m_serverPort;
    QString m_terminalName;
    bool m_isDomain = false;

    // Agreed with other components, and called by them only.
public:
    QString readServerHost() const { return m_serverHost; }
    QString readServerPort() const { return m_serverPort; }
    QString readDomainHost() const { return m_domainHost; }
    QString readDomainPort() const { return m_domainPort; }
    bool readIsDomain() const { return m_isDomain; }
    void setServerHost(const QString& host) { m_serverHost = host; }
    void setServerPort(const QString& port) { m_serverPort = port; }
    void setDomainHost(const QString& host) { m_domainHost = host; }
    void setDomainPort(const QString& port) { m_domainPort = port; }
    void setTerminalName(const QString& name) { m_terminalName = name; }
    /// Writes the decoded certificate to `filePath`, making its directory where needed. Failures are logged.
    void saveCert(const QString& base64Content, const QString& filePath);
};

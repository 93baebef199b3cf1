// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

/// Well-known paths and URL templates of the platform. Each is written here and nowhere else.
namespace zent
{

/// The terminal info file, which other components of the platform write.
inline const QString kUserinfoPath = QStringLiteral("/etc/zent/userinfo.json");
/// Staging copy of the terminal info file.
inline const QString kTmpUserinfoPath = QStringLiteral("/tmp/zent/userinfo.json");
/// The terminal's machine identifier.
inline const QString kMachineidPath = QStringLiteral("/usr/share/zent/machine.txt");

/// Certificate authority of the management server.
inline const QString kServerCertPath = QStringLiteral("/etc/zent/clientapi_ca.crt");
/// Certificate with which this terminal proves itself to the management server.
inline const QString kPublicKeyPath = QStringLiteral("/etc/zent/QEL_Zent.pem");
/// Private key of that certificate.
inline const QString kPrivateKeyPath = QStringLiteral("/etc/zent/.QEL_Zent.key");

/// Where the server keeps the rule for terminal names; %1 host, %2 port.
inline const QString KPCRegular = QStringLiteral("https://%1:%2/uim/v3/client/config?key=pc_name_rules");

/// Names the modules of the control center: key "ControlCenterList" of the group "config".
inline const QString kBackupConfigPath = QStringLiteral("/etc/zent/config.ini");

/// The host name, in the desktop's own file.
inline const QString kHostnamePath = QStringLiteral("/etc/hostname");
/// Version file of the operating system.
inline const QString kOsVersionPath = QStringLiteral("/etc/os-version");
/// Code of the scene the user works in; %1 login name.
inline const QString kCurrentScenePath = QStringLiteral("/home/%1/.cache/vantor/CurrentScene");

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>

/// Whether the terminal has joined the domain, by the terminal info file. A file that can be read but does not say so
/// is logged.
bool isDomain();

/// Whether the session user belongs to the platform's directory: the output of "id" names the platform.
bool isLDAPUser();

/// The operating system's minor version: 1000 without a version file, −1 when it cannot be read or names none.
int getMiniVersion();

namespace zent
{

/// Whether the content of a terminal info file says that the terminal is in the domain; only a JSON true does.
bool saysInDomain(const QByteArray& infoFile);

/// The last minor version named in the text of a version file, −1 when there is none.
int minorVersionIn(const QString& versionFile);

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>

/// Targets beside the parsers: what is read from the terminal's files, and the forms that texts of others are given.
namespace fuzz
{

/// A terminal info file as the addresses of the servers are read from it.
QString readFileConfig(const QByteArray& input);
/// A terminal info file of the older form: reading it again after its migration gives the same.
QString migrateUserInfo(const QByteArray& input);
/// A text in a log line, alone and in a URL.
QString logTexts(const QByteArray& input);
/// The address of a server and, after the first line feed, a value for its query.
QString buildUrls(const QByteArray& input);
/// A list reply: three count headers, one a line, and the body.
QString countMessages(const QByteArray& input);

} // namespace fuzz

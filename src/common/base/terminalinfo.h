// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "filewrite.h"
#include "paths.h"

#include <QByteArray>
#include <QJsonObject>
#include <QString>

#include <functional>
#include <optional>

/// The one place that opens the terminal info file and the machine identifier. What their content means, and what is
/// logged or shown about it, is the caller's.
namespace zent::base
{

/// Keys of the terminal info file that more than one class reads.
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

/// Whether FileProxy logs that a file could not be opened.
enum class OpenFailure { Silent, Logged };

/// What came of reading a file.
struct FileReading {
    bool exists = false;
    bool opened = false;
    QByteArray content;
    /// Of the opening that failed.
    FileError error;
};

/// Reads the terminal info file, or a copy of it at another `path`.
FileReading readTerminalInfo(const QString& path = kUserinfoPath, OpenFailure failure = OpenFailure::Silent);
/// Reads the machine identifier's file.
FileReading readMachineId(OpenFailure failure = OpenFailure::Silent);

/// The terminal info file's object, or nothing when `content` is not one JSON object.
std::optional<QJsonObject> parseInfoObject(const QByteArray& content);

/// What came of changing the terminal info file.
struct InfoChange {
    enum class State {
        Done,
        Declined,   ///< the edit did not want it
        NotOpened,  ///< for reading
        NotObject,  ///< not one JSON object; it may be in the middle of being written, so it stays as it is
        NotWritten, ///< it could not be opened for writing
        Short,      ///< not written whole
    };
    State state = State::Done;
    /// Of State::NotOpened, State::NotWritten and State::Short.
    FileError error;
};

/// Has `edit` change the object of the terminal info file and writes it back, unless `edit` returns false.
InfoChange changeTerminalInfo(const std::function<bool(QJsonObject&)>& edit, OpenFailure failure = OpenFailure::Silent);
/// Replaces the whole terminal info file.
InfoChange writeTerminalInfo(const QJsonObject& object);

} // namespace zent::base

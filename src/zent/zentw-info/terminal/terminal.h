// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "filewrite.h"

#include <QString>

#include <optional>

namespace zent
{

/// What the terminal's own files say of it and of its server; empty where they say nothing.
struct Terminal {
    QString serverHost;
    QString serverPort;
    QString machineId;
    QString hostName;

    /// The server as "host:port".
    QString server() const { return serverHost + QLatin1Char(':') + serverPort; }

    /// Reads everything. Without the terminal info file nothing is read, without the machine identifier's file nothing
    /// of the former's content.
    void read();

    /// Why the terminal info file cannot be opened where it is missing, which is logged; nothing where it is there.
    static std::optional<base::FileError> missingInfoFile();
};

/// The machine's host name.
QString localHostName();

} // namespace zent

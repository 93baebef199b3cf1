// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>
#include <QtGlobal>

namespace zent
{

/// Log levels, numerically the priorities of syslog.
enum LEVEL {
    LEVEL_EMERGENCY = 0,
    LEVEL_ALERT = 1,
    LEVEL_CRITICAL = 2,
    LEVEL_ERROR = 3,
    LEVEL_WARNING = 4,
    LEVEL_NOTICE = 5,
    LEVEL_INFO = 6,
    LEVEL_DEBUG = 7,
};

/// Opens the system log under the executable's name and sends every Qt log message there whose priority is at most
/// `level`. Debug messages are switched off at their source unless `level` is LEVEL_DEBUG.
void uOpenlog(LEVEL level);

/// Closes the system log.
void uCloselog();

/// What the system log says of a Qt message, without the time; a message ends at its first NUL.
QByteArray logRecord(QtMsgType type, const QMessageLogContext& context, const QString& message);

/// Writes one Qt message as one syslog record. May be called from any thread; a fatal message is only logged.
void uSyslogMessageHandler(QtMsgType type, const QMessageLogContext& context, const QString& message);

} // namespace zent

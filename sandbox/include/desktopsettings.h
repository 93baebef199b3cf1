// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QProcess>
#include <QStringList>

/// The settings of the desktop that managing a terminal and releasing it change.
namespace desktopsettings
{

inline const char* const kManage = R"(set -e
set_lock="gsettings set com.vantor.zent.lockdown"
for key in $(gsettings list-keys com.vantor.zent.lockdown | grep "able$" | grep -v hotspot); do
    $set_lock $key false
done
$set_lock hotspot-enable 0
$set_lock control-center-hidden '["accounts"]'
set_center="gsettings set com.vantor.oxa.control-center"
$set_center auto-login-visable true
$set_center nopasswd-login-visable true
$set_center hide-module '["accounts"]')";

/// The output of a shell command, which reads and sets the desktop's settings with the desktop's own tool.
inline QStringList shell(const QString& command)
{
    QProcess program;
    program.start("/bin/sh", {"-c", command});
    if (!program.waitForFinished() || program.exitCode() != 0)
        qFatal("%s: %s", qPrintable(command), program.readAllStandardError().constData());
    return QString::fromUtf8(program.readAllStandardOutput()).split('\n', Qt::SkipEmptyParts);
}

/// Sets everything that a release changes to what it is not afterwards.
inline void manage()
{
    shell(kManage);
}

/// The control center's keys and values, and how many of the lock-down's keys have which value.
inline QStringList values()
{
    return shell("export LC_ALL=C; gsettings list-recursively com.vantor.oxa.control-center | cut -d' ' -f2- | sort; "
                 "gsettings list-recursively com.vantor.zent.lockdown | cut -d' ' -f3- | sort | uniq -c | tr -s ' '");
}

} // namespace desktopsettings

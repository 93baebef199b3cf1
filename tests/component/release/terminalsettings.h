#pragma once

#include <QProcess>
#include <QStringList>

/// The desktop's settings that a release changes, read and set with the desktop's own tool.
namespace terminalsettings
{

inline const QString kControlCenter = QStringLiteral("com.vantor.oxa.control-center");
inline const QString kLockDown = QStringLiteral("com.vantor.zent.lockdown");

/// The output of a shell command; fails loudly.
inline QString shell(const QString& command, const QStringList& arguments = {})
{
    QProcess program;
    program.start("/bin/sh", QStringList{"-c", command, "sh"} + arguments);
    if (!program.waitForFinished() || program.exitCode() != 0)
        qFatal("%s: %s", qPrintable(command), program.readAllStandardError().constData());
    return QString::fromUtf8(program.readAllStandardOutput()).trimmed();
}

/// Every key of the two schemas as "key value", sorted.
inline QStringList all()
{
    const QString list = "gsettings list-recursively ";
    return shell('(' + list + kControlCenter + ';' + list + kLockDown + ") | cut -d' ' -f2- | LC_ALL=C sort")
        .split('\n');
}

/// All settings where the lock-down's switches have the one value and the other keys these lines.
inline QStringList settings(const QString& switches, QStringList lines)
{
    for (const char* name :
         {"launcher-displayable", "recycle-bin-displayable", "shortcut-key-enable", "resident-taskbar-app-displayable",
          "usb-tray-icon-clickable", "taskbar-rightclick-menu-enable", "web-tray-icon-clickable"})
        lines.append(name + (' ' + switches));
    lines.sort();
    return lines;
}

inline const QStringList kManaged =
    settings("false", {"auto-login-visable true", "nopasswd-login-visable true", "hide-module ['accounts', 'update']",
                       "control-center-shown ['display']", "control-center-hidden ['accounts']", "hotspot-enable 0"});
inline const QStringList kReleased = settings(
    "true", {"auto-login-visable false", "nopasswd-login-visable false", "hide-module @as []",
             "control-center-shown ['accounts', 'network']", "control-center-hidden ['']", "hotspot-enable 1"});

/// Gives every setting its value of kManaged.
inline void manage()
{
    QString commands;
    for (const QString& line : kManaged) {
        const bool isControlCenter = line.contains("-visable") || line.startsWith("hide-module");
        commands +=
            QStringLiteral("gsettings set %1 %2 \"%3\" && ")
                .arg(isControlCenter ? kControlCenter : kLockDown, line.section(' ', 0, 0), line.section(' ', 1));
    }
    shell(commands + "true");
}

} // namespace terminalsettings

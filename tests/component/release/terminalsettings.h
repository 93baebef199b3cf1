#pragma once

#include <QProcess>
#include <QStringList>

/// The desktop's settings that a release changes, read and set with the desktop's own tool.
namespace terminalsettings
{

inline const QString kControlCenter = QStringLiteral("com.vantor.oxa.control-center");
inline const QString kLockDown = QStringLiteral("com.vantor.zent.lockdown");
inline const QStringList kLockDownSwitches{"launcher-displayable",    "recycle-bin-displayable",
                                           "shortcut-key-enable",     "resident-taskbar-app-displayable",
                                           "usb-tray-icon-clickable", "taskbar-rightclick-menu-enable",
                                           "web-tray-icon-clickable"};

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
    QStringList lines =
        shell("gsettings list-recursively " + kControlCenter + "; gsettings list-recursively " + kLockDown).split('\n');
    for (QString& line : lines)
        line = line.section(' ', 1);
    lines.sort();
    return lines;
}

inline QStringList lockDownSettings(const char* switches, const QStringList& others)
{
    QStringList lines = others;
    for (const QString& name : kLockDownSwitches)
        lines.append(name + ' ' + switches);
    lines.sort();
    return lines;
}

inline const QStringList kManaged = lockDownSettings(
    "false", {"auto-login-visable true", "nopasswd-login-visable true", "hide-module ['accounts', 'update']",
              "control-center-shown ['display']", "control-center-hidden ['accounts']", "hotspot-enable 0"});
inline const QStringList kReleased = lockDownSettings(
    "true", {"auto-login-visable false", "nopasswd-login-visable false", "hide-module @as []",
             "control-center-shown ['accounts', 'network']", "control-center-hidden ['']", "hotspot-enable 1"});

/// Gives every setting its value of kManaged.
inline void manage()
{
    QString commands;
    for (const QString& line : kManaged) {
        const QString key = line.section(' ', 0, 0);
        const bool isControlCenter = key.endsWith("-visable") || key == "hide-module";
        commands += QStringLiteral("gsettings set %1 %2 \"%3\" && ")
                        .arg(isControlCenter ? kControlCenter : kLockDown, key, line.section(' ', 1));
    }
    shell(commands + "true");
}

} // namespace terminalsettings

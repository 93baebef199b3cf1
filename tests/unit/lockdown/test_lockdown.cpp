// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "libzentoxa.h"

#include <utility>

namespace
{

/// The setters of a boolean and the keys they change.
const QList<QPair<QString, bool (Libzentoxa::*)(bool)>> kSwitches = {
    {"launcher-displayable", &Libzentoxa::SetLauncherDisplayable},
    {"recycle-bin-displayable", &Libzentoxa::SetRecycleBinDisplayable},
    {"resident-taskbar-app-displayable", &Libzentoxa::SetResidentTaskbarAppDisplayable},
    {"shortcut-key-enable", &Libzentoxa::SetShortcutKeyEnable},
    {"taskbar-rightclick-menu-enable", &Libzentoxa::SetTaskbarRightclickMenuEnable},
    {"usb-tray-icon-clickable", &Libzentoxa::SetUsbTrayIconClickable},
    {"web-tray-icon-clickable", &Libzentoxa::SetWebTrayIconClickable},
};

/// Each key of the schema and its value, as another program sees them.
QMap<QString, QString> storedSettings()
{
    QProcess reader;
    reader.start("gsettings", {"list-recursively", "com.vantor.zent.lockdown"});
    reader.waitForFinished();
    QMap<QString, QString> settings;
    for (const QString& line : QString::fromUtf8(reader.readAll()).split('\n', Qt::SkipEmptyParts))
        settings.insert(line.section(' ', 1, 1), line.section(' ', 2));
    return settings;
}

} // namespace

class TestLockdown : public QObject
{
    Q_OBJECT

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void everySetterChangesItsKeysOnly()
    {
        // Seen at once: neither an event loop nor the end of the object comes between.
        Libzentoxa lockdown;
        QMap<QString, QString> expected = storedSettings();
        QCOMPARE(expected.size(), 10);
        const auto changed = [&](const QString& key, const QString& value) {
            return std::exchange(expected[key], value) != value && storedSettings() == expected;
        };
        for (const bool on : {false, true}) {
            for (const auto& [key, setter] : kSwitches)
                QVERIFY2((lockdown.*setter)(on) && changed(key, on ? "true" : "false"), qPrintable(key));
            QVERIFY(lockdown.SetHotspotEnable(on) && changed("hotspot-enable", on ? "1" : "0"));
        }
        expected["control-center-shown"] = "['network', '电源']";
        QVERIFY(lockdown.SetControlConfig({"network", "电源"}, {""}) && changed("control-center-hidden", "['']"));
    }

    /// Runs where another schema is installed than the agreed one, or none.
    void otherSchema_data() { fixture::addRows("lockdown.json"); }
    void otherSchema()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        Libzentoxa lockdown;
        QVERIFY(!lockdown.SetHotspotEnable(false));
        int stored = 0;
        for (const auto& entry : kSwitches)
            stored += (lockdown.*entry.second)(false);
        QCOMPARE(stored, row["stored"].toInt());
        QJsonObject settings;
        const QMap<QString, QString> seen = storedSettings();
        for (auto setting = seen.begin(); setting != seen.end(); ++setting)
            settings[setting.key()] = setting.value();
        fixture::compare(settings, row["settings"]);
        fixture::compareLog(log, row["log"]);
    }
};

QTEST_GUILESS_MAIN(TestLockdown)
#include "test_lockdown.moc"

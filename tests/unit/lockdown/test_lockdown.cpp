// SPDX-License-Identifier: Apache-2.0
#include "libzentoxa.h"

#include <QProcess>
#include <QTemporaryDir>
#include <QtTest>

#include <utility>

namespace
{

const char* const kApplyAll = "--apply-all";

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

/// What a program prints, and its exit status as the last word.
QString run(const QString& program, const QStringList& arguments)
{
    QProcess process;
    process.setProcessChannelMode(QProcess::MergedChannels);
    process.start(program, arguments);
    if (!process.waitForFinished() || process.exitStatus() != QProcess::NormalExit)
        return "crashed";
    return QString::fromUtf8(process.readAll()) + QString::number(process.exitCode());
}

/// Each key of the schema and its value, as another program sees them.
QMap<QString, QString> storedSettings()
{
    QMap<QString, QString> settings;
    for (const QString& line : run("gsettings", {"list-recursively", "com.vantor.zent.lockdown"}).split('\n'))
        settings.insert(line.section(' ', 1, 1), line.section(' ', 2));
    settings.remove("");
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

    void missingAndOlderSchema()
    {
        // The older one has fewer settings, and one of them with other limits.
        const QTemporaryDir directory;
        qputenv("GSETTINGS_SCHEMA_DIR", directory.path().toUtf8());
        const auto applyAll = [] { return run(QCoreApplication::applicationFilePath(), {kApplyAll}); };
        const QString missing = applyAll();
        QCOMPARE(missing, "settings schema is not installed, the desktop stays as it is: com.vantor.zent.lockdown\n0");
        QVERIFY(QFile::copy(ZENT_TEST_DATA "/olderlockdown.gschema.xml", directory.filePath("a.gschema.xml")));
        QCOMPARE(run("glib-compile-schemas", {directory.path()}), QString("0"));
        const QString older = applyAll();
        const QString line = "\nsetting cannot be changed: com.vantor.zent.lockdown hotspotEnable QVariant(int, 0)\n1";
        QVERIFY2(older.endsWith(line), qPrintable(older));
        QCOMPARE(storedSettings(),
                 (QMap<QString, QString>{{"hotspot-enable", "1"}, {"recycle-bin-displayable", "false"}}));
    }
};

int main(int argc, char** argv)
{
    QCoreApplication application(argc, argv);
    if (application.arguments().contains(kApplyAll)) {
        // As another program under another schema: tells how many values were stored.
        Libzentoxa lockdown;
        int stored = lockdown.SetHotspotEnable(0);
        for (const auto& entry : kSwitches)
            stored += (lockdown.*entry.second)(false);
        return stored;
    }
    TestLockdown test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_lockdown.moc"

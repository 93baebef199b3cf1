#include "libzentoxa.h"
#include "testfiles.h"

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

struct Output {
    int exitCode = -1;
    QByteArray out;
    QByteArray err;
};

Output run(const QString& program, const QStringList& arguments, const QString& schemaDirectory = {})
{
    QProcess process;
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    if (!schemaDirectory.isEmpty())
        environment.insert("GSETTINGS_SCHEMA_DIR", schemaDirectory);
    process.setProcessEnvironment(environment);
    process.start(program, arguments);
    if (!process.waitForFinished() || process.exitStatus() != QProcess::NormalExit)
        return {};
    return {process.exitCode(), process.readAllStandardOutput().trimmed(), process.readAllStandardError()};
}

/// Each key of the schema and its value, as another program sees them.
QMap<QString, QString> storedSettings(const QString& schemaDirectory = {})
{
    QMap<QString, QString> settings;
    const QByteArray listing = run("gsettings", {"list-recursively", "com.vantor.zent.lockdown"}, schemaDirectory).out;
    for (const QString& line : QString::fromUtf8(listing).split('\n'))
        settings.insert(line.section(' ', 1, 1), line.section(' ', 2));
    return settings;
}

} // namespace

class TestLockdown : public QObject
{
    Q_OBJECT

    static Output child(const QString& schemaDirectory)
    {
        return run(QCoreApplication::applicationFilePath(), {kApplyAll}, schemaDirectory);
    }

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

    void schemaNotInstalled()
    {
        QTemporaryDir empty;
        const Output output = child(empty.path());
        QCOMPARE(output.exitCode, 0);
        QCOMPARE(output.err.count("schema is not installed"), 1);
    }

    void olderSchema()
    {
        // Fewer settings, and one of them with other limits.
        QTemporaryDir directory;
        testfiles::write(directory.filePath("a.gschema.xml"), R"(<schemalist>
            <schema id="com.vantor.zent.lockdown" path="/com/vantor/zent/lockdown/">
              <key name="hotspot-enable" type="i"><range min="1" max="2"/><default>1</default></key>
              <key name="recycle-bin-displayable" type="b"><default>true</default></key>
              <key name="shortcut-key-enable" type="b"><default>true</default></key>
            </schema></schemalist>)");
        QCOMPARE(run("glib-compile-schemas", {directory.path()}).exitCode, 0);
        const Output output = child(directory.path());
        QCOMPARE(output.exitCode, 2);
        QCOMPARE(storedSettings(directory.path()),
                 (QMap<QString, QString>{
                     {"hotspot-enable", "1"}, {"recycle-bin-displayable", "false"}, {"shortcut-key-enable", "false"}}));
        QCOMPARE(output.err.count("setting cannot be changed"), 1);
    }
};

int main(int argc, char** argv)
{
    QCoreApplication application(argc, argv);
    if (application.arguments().contains(kApplyAll)) {
        // As another program under another schema: tells how many values were stored.
        Libzentoxa lockdown;
        int stored = lockdown.SetControlConfig({"accounts"}, {""}) + lockdown.SetHotspotEnable(0);
        for (const auto& entry : kSwitches)
            stored += (lockdown.*entry.second)(false);
        return stored;
    }
    TestLockdown test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_lockdown.moc"

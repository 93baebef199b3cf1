#include "libzentoxa.h"
#include "testfiles.h"

#include <QProcess>
#include <QTemporaryDir>
#include <QtTest>

#include <functional>

namespace
{

const QString kSchema = QStringLiteral("com.vantor.zent.lockdown");
const char* const kApplyAll = "--apply-all";

using Setter = std::function<bool(Libzentoxa&)>;

/// Calls every setter; returns how many of them stored their value.
int applyAll(bool enable)
{
    Libzentoxa lockdown;
    return lockdown.SetControlConfig({"accounts"}, {""}) + lockdown.SetHotspotEnable(enable) +
           lockdown.SetShortcutKeyEnable(enable) + lockdown.SetLauncherDisplayable(enable) +
           lockdown.SetTaskbarRightclickMenuEnable(enable) + lockdown.SetResidentTaskbarAppDisplayable(enable) +
           lockdown.SetRecycleBinDisplayable(enable) + lockdown.SetWebTrayIconClickable(enable) +
           lockdown.SetUsbTrayIconClickable(enable);
}

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
    const QByteArray listing = run("gsettings", {"list-recursively", kSchema}, schemaDirectory).out;
    for (const QString& line : QString::fromUtf8(listing).split('\n'))
        settings.insert(line.section(' ', 1, 1), line.section(' ', 2));
    return settings;
}

} // namespace

Q_DECLARE_METATYPE(Setter)

class TestLockdown : public QObject
{
    Q_OBJECT

    static Output child(const QString& schemaDirectory)
    {
        return run(QCoreApplication::applicationFilePath(), {kApplyAll}, schemaDirectory);
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void changesItsKeysOnly_data()
    {
        QTest::addColumn<Setter>("setter");
        QTest::addColumn<QStringList>("settings");
        const auto row = [](const char* key, const char* value, const Setter& setter) {
            QTest::newRow(QByteArray(key) + ' ' + value) << setter << QStringList{key, value};
        };
        QTest::newRow("control centre") << Setter([](Libzentoxa& l) {
            return l.SetControlConfig({"network", QStringLiteral("电源")}, {""});
        })
                                        << QStringList{"control-center-shown", QStringLiteral("['network', '电源']"),
                                                       "control-center-hidden", "['']"};
        row("hotspot-enable", "0", [](Libzentoxa& l) { return l.SetHotspotEnable(0); });
        row("shortcut-key-enable", "false", [](Libzentoxa& l) { return l.SetShortcutKeyEnable(false); });
        row("launcher-displayable", "false", [](Libzentoxa& l) { return l.SetLauncherDisplayable(false); });
        row("taskbar-rightclick-menu-enable", "false",
            [](Libzentoxa& l) { return l.SetTaskbarRightclickMenuEnable(false); });
        row("resident-taskbar-app-displayable", "false",
            [](Libzentoxa& l) { return l.SetResidentTaskbarAppDisplayable(false); });
        row("recycle-bin-displayable", "false", [](Libzentoxa& l) { return l.SetRecycleBinDisplayable(false); });
        row("web-tray-icon-clickable", "false", [](Libzentoxa& l) { return l.SetWebTrayIconClickable(false); });
        row("usb-tray-icon-clickable", "false", [](Libzentoxa& l) { return l.SetUsbTrayIconClickable(false); });
    }
    void changesItsKeysOnly()
    {
        QFETCH(Setter, setter);
        QFETCH(QStringList, settings);
        QMap<QString, QString> expected = storedSettings();
        QCOMPARE(expected.size(), 10);
        for (int i = 0; i < settings.size(); i += 2) {
            QVERIFY(expected.value(settings.at(i)) != settings.at(i + 1));
            expected[settings.at(i)] = settings.at(i + 1);
        }
        Libzentoxa lockdown;
        QVERIFY(setter(lockdown));
        // At once: neither an event loop nor the end of the object comes between.
        QCOMPARE(storedSettings(), expected);
    }

    void bothWays()
    {
        QCOMPARE(applyAll(false), 9);
        QCOMPARE(applyAll(true), 9);
        QMap<QString, QString> settings = storedSettings();
        QCOMPARE(settings.take("control-center-shown"), QString("['accounts']"));
        QCOMPARE(settings.take("control-center-hidden"), QString("['']"));
        QCOMPARE(settings.take("hotspot-enable"), QString("1"));
        QCOMPARE(settings.values(), QVector<QString>(7, "true").toList());
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
    if (application.arguments().contains(kApplyAll))
        return applyAll(false);
    TestLockdown test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_lockdown.moc"

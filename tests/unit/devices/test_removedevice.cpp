#include "logcapture.h"
#include "processrecord.h"
#include "removedevice.h"

#include <QRegularExpression>
#include <QtTest>

#include <unistd.h>

namespace
{

const QString kPhone = QStringLiteral("mtp:host=ACME_Foo_Bar%3A1_SN001");
const QString kTwin = QStringLiteral("mtp:host=ACME_Foo_Bar%3A1_SN002");
const QString kCamera = QStringLiteral("gphoto2:host=Other_SN001");

} // namespace

class TestRemoveDevice : public QObject
{
    Q_OBJECT

    const QString m_uid = QString::number(getuid());
    const QString m_root = "/run/user/" + m_uid + "/gvfs";
    const QString m_outside = QStringLiteral("/tmp/elsewhere");
    const QString m_gioPlan = qEnvironmentVariable("ROOM") + "/standin/gio.rc";

    /// The paths that gio was told to unmount, in no particular order.
    static QStringList unmounted()
    {
        QStringList paths;
        for (const QJsonObject& entry : processrecord::entries("gio")) {
            QStringList words = processrecord::words(entry);
            const bool asExpected = words.size() == 3 && words.takeFirst() == "mount" && words.takeFirst() == "-u";
            paths.append(asExpected ? words.first() : "unexpected: " + words.join(' '));
        }
        paths.sort();
        return paths;
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void init()
    {
        processrecord::clear();
        for (const QString& name : {kPhone, kTwin, kCamera})
            QVERIFY(QDir().mkpath(m_root + '/' + name + "/inner_SN001"));
        testfiles::write(m_root + "/file_SN001", "no directory");
        QVERIFY(QDir().mkpath(m_outside + "/gvfs/mount_SN001"));
        QVERIFY(QFile::link(m_outside, m_root + "/away_SN001"));
        QVERIFY(QFile::link(m_root + '/' + kTwin, m_root + "/twin_SN001"));
    }

    void cleanup()
    {
        testfiles::remove(m_root);
        testfiles::remove(m_outside);
        testfiles::remove(m_gioPlan);
    }

    void unmountsBySerial()
    {
        const QMap<QString, QStringList> rows = {
            {"SN002", {kTwin}}, {"SN001", {kCamera, kPhone}},                      // the serial alone decides
            {"sn001", {}},      {"", {kCamera, kPhone, kTwin}}, {"-f;*$(id)", {}}, // no pattern, no option, no shell
        };
        for (auto row = rows.begin(); row != rows.end(); ++row) {
            processrecord::clear();
            RemoveDevice(nullptr).removeDevice("ACME", "Foo Bar:1", row.key(), m_uid);
            QCOMPARE(unmounted(), QStringList(row.value()).replaceInStrings(QRegularExpression("^"), m_root + '/'));
        }
    }

    void staysBelowTheMountRoot()
    {
        // Only what is a user id may become part of a path.
        for (const QString& uid : {m_uid + "/../../../tmp/elsewhere", QString("../../tmp/elsewhere"), "./" + m_uid,
                                   QString(), QString("zhangsan"), QString("１０００"), m_uid + '\n'}) {
            LogCapture log;
            RemoveDevice(nullptr).removeDevice("", "", "", uid);
            QCOMPARE(unmounted(), QStringList());
            QCOMPARE(log.count("not a user id"), 1);
        }
    }

    void failuresDoNotStopIt()
    {
        testfiles::write(m_gioPlan, "2");
        RemoveDevice(nullptr).removeDevice("", "", "", m_uid);
        QCOMPARE(unmounted().size(), 3);
    }
};

QTEST_GUILESS_MAIN(TestRemoveDevice)
#include "test_removedevice.moc"

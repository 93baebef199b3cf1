// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "processrecord.h"
#include "removedevice.h"

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
    const QString m_gioHook = qEnvironmentVariable("ROOM") + "/standin/gio.hook";

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
        testfiles::remove(m_gioHook);
    }

    void unmounts_data() { fixture::addRows("mounts.json"); }
    void unmounts()
    {
        QFETCH(QJsonObject, row);
        const QString uid = row.value("uid").toString("UID").replace("UID", m_uid);
        const LogCapture log;
        RemoveDevice(nullptr).removeDevice("ACME", "Foo Bar:1", row["serial"].toString(), uid);
        fixture::compare(QJsonArray::fromStringList(unmounted().replaceInStrings(m_root + '/', "")), row["unmounted"]);
        // Only what is a user id may become part of a path.
        QCOMPARE(log.count("not a user id"), row.contains("uid") ? 1 : 0);
        fixture::compareLog(log, row["log"]);
    }

    void failuresDoNotStopIt()
    {
        testfiles::write(m_gioPlan, "2");
        LogCapture log;
        RemoveDevice(nullptr).removeDevice("", "", "", m_uid);
        QCOMPARE(unmounted().size(), 3);
        QCOMPARE(log.count("unmount failed: 2"), 3);
    }

    void silentProgramIsKilledAndTheRestSkipped()
    {
        // It waits for input: there is none, and its end is there at once.
        testfiles::write(m_gioHook, "cat");
        RemoveDevice device(nullptr);
        device.removeDevice("", "", "", m_uid);
        QCOMPARE(unmounted().size(), 3);
        processrecord::clear();
        testfiles::write(m_gioHook, "exec sleep 30");
        device.setTimeLimit(300);
        LogCapture log;
        QElapsedTimer timer;
        timer.start();
        device.removeDevice("", "", "", m_uid);
        QVERIFY(timer.elapsed() < 5000);
        QCOMPARE(unmounted().size(), 1);
        QCOMPARE(log.count("unmount failed: time is up, skipped as well: 2"), 1);
    }
};

QTEST_GUILESS_MAIN(TestRemoveDevice)
#include "test_removedevice.moc"

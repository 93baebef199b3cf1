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
        testfiles::write(m_gioPlan, row["status"].toString("0").toUtf8());
        testfiles::write(m_gioHook, row["hook"].toString().toUtf8());
        RemoveDevice device(nullptr);
        device.setTimeLimit(row["limit"].toInt(20000));
        const LogCapture log;
        QElapsedTimer timer;
        timer.start();
        device.removeDevice("ACME", "Foo Bar:1", row["serial"].toString(), uid);
        QVERIFY(timer.elapsed() < 15000);
        fixture::compare(QJsonArray::fromStringList(unmounted().replaceInStrings(m_root + '/', "")), row["unmounted"]);
        fixture::compareLog(log, row["log"]);
    }
};

QTEST_GUILESS_MAIN(TestRemoveDevice)
#include "test_removedevice.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "processrecord.h"
#include "removedevice.h"

#include <unistd.h>

class TestRemoveDevice : public QObject
{
    Q_OBJECT

    const QString m_uid = QString::number(getuid());
    const QString m_root = "/run/user/" + m_uid + "/gvfs/";
    const QString m_outside = QStringLiteral("/tmp/elsewhere");
    const QString m_standIn = qEnvironmentVariable("ROOM") + "/standin/gio";
    const QByteArray m_path = qgetenv("PATH");

private slots:
    void initTestCase()
    {
        const QString twin = m_root + "mtp:host=ACME_Foo_Bar%3A1_SN002";
        for (const QString& mount : {twin, m_root + "mtp:host=ACME_Foo_Bar%3A1_SN001",
                                     m_root + "gphoto2:host=Other_SN001", m_outside + "/gvfs/mount"})
            QVERIFY(QDir().mkpath(mount + "/inner_SN001"));
        testfiles::write(m_root + "file_SN001", "no directory");
        QVERIFY(QFile::link(m_outside, m_root + "away_SN001"));
        QVERIFY(QFile::link(twin, m_root + "twin_SN001"));
    }
    void cleanup() { qputenv("PATH", m_path); }

    void unmounts_data() { fixture::addRows("mounts.json"); }
    void unmounts()
    {
        QFETCH(QJsonObject, row);
        const QString uid = row.value("uid").toString("UID").replace("UID", m_uid);
        testfiles::write(m_standIn + ".rc", row["status"].toString("0").toUtf8());
        testfiles::write(m_standIn + ".hook", row["hook"].toString().toUtf8());
        qputenv("PATH", row["path"].toString(m_path).toUtf8());
        processrecord::clear();
        RemoveDevice device(nullptr);
        device.setTimeLimit(row["limit"].toInt(20000));
        const LogCapture log;
        QElapsedTimer timer;
        timer.start();
        device.removeDevice("ACME", "Foo Bar:1", row["serial"].toString(), uid);
        QVERIFY(timer.elapsed() < 15000);
        QStringList commands;
        for (const QJsonObject& entry : processrecord::entries("gio"))
            commands += processrecord::words(entry).join(' ');
        fixture::compareLines(commands, row["commands"]);
        fixture::compareLog(log, row["log"]);
    }
};

QTEST_GUILESS_MAIN(TestRemoveDevice)
#include "test_removedevice.moc"

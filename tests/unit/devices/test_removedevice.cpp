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
            const QStringList words = processrecord::words(entry);
            paths.append(words.mid(0, 2) == QStringList{"mount", "-u"} && words.size() == 3 ? words.at(2)
                                                                                            : words.join(' '));
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

    void unmountsBySerial_data()
    {
        QTest::addColumn<QString>("manufacturer");
        QTest::addColumn<QString>("product");
        QTest::addColumn<QString>("serial");
        QTest::addColumn<QStringList>("names");
        QTest::newRow("all three fit") << "ACME"
                                       << "Foo Bar:1"
                                       << "SN002" << QStringList{kTwin};
        QTest::newRow("serial alone decides") << "Nobody"
                                              << "Nothing"
                                              << "SN001" << QStringList{kCamera, kPhone};
        QTest::newRow("only the serial differs") << "ACME"
                                                 << "Foo Bar:1"
                                                 << "SN003" << QStringList();
        QTest::newRow("case matters") << "ACME"
                                      << "Foo Bar:1"
                                      << "sn001" << QStringList();
        QTest::newRow("empty serial") << ""
                                      << ""
                                      << "" << QStringList{kCamera, kPhone, kTwin};
        QTest::newRow("a dot") << ""
                               << ""
                               << "." << QStringList();
        QTest::newRow("no pattern, no option, no shell") << ""
                                                         << ""
                                                         << "-f;*$(id)" << QStringList();
    }
    void unmountsBySerial()
    {
        QFETCH(QString, manufacturer);
        QFETCH(QString, product);
        QFETCH(QString, serial);
        QFETCH(QStringList, names);
        RemoveDevice(nullptr).removeDevice(manufacturer, product, serial, m_uid);
        QCOMPARE(unmounted(), names.replaceInStrings(QRegularExpression("^"), m_root + '/'));
    }

    void staysBelowTheMountRoot_data()
    {
        QTest::addColumn<QString>("uid");
        QTest::newRow("other directory") << m_uid + "/../../../tmp/elsewhere";
        QTest::newRow("dots only") << "../../tmp/elsewhere";
        QTest::newRow("detour") << "./" + m_uid;
        QTest::newRow("empty") << "";
        QTest::newRow("name") << "zhangsan";
        QTest::newRow("other digits") << QStringLiteral("１０００");
        QTest::newRow("line break") << m_uid + "\n";
        QTest::newRow("no mount root") << "4000000000";
    }
    void staysBelowTheMountRoot()
    {
        QFETCH(QString, uid);
        LogCapture log;
        RemoveDevice(nullptr).removeDevice("", "", "", uid);
        QCOMPARE(unmounted(), QStringList());
        QCOMPARE(log.lines().value(0), QString("removeDevice ------------i"));
        QCOMPARE(log.lines().size(), 2);
    }

    void failuresDoNotStopIt_data()
    {
        QTest::addColumn<bool>("installed");
        QTest::newRow("gio fails") << true;
        QTest::newRow("no gio") << false;
    }
    void failuresDoNotStopIt()
    {
        QFETCH(bool, installed);
        testfiles::write(m_gioPlan, "2");
        const QByteArray searchPath = qgetenv("PATH");
        if (!installed)
            qputenv("PATH", "/nowhere");
        LogCapture log;
        RemoveDevice(nullptr).removeDevice("", "", "", m_uid);
        qputenv("PATH", searchPath);
        QCOMPARE(unmounted().size(), installed ? 3 : 0);
        QCOMPARE(log.count("Driver: "), 3);
    }

    void logInOrder()
    {
        for (const QString& name : {kTwin, kCamera})
            testfiles::remove(m_root + '/' + name);
        LogCapture log;
        RemoveDevice(nullptr).removeDevice("ACME", "Foo Bar:1", "SN001", m_uid);
        const QString path = '"' + m_root + '/' + kPhone + '"';
        const QString start = QString("/run/user/%1/gvfs/mtp:host=").arg(m_uid);
        const QStringList expected{
            "removeDevice ------------i",
            "find path:  \"" + m_root + "/\"",
            "dir:  " + path,
            "removeDevice manufacturer: \"ACME\" :product: \"Foo Bar:1\" :serial: \"SN001\" :uid: \"" + m_uid + '"',
            "manufacturer:  \"ACME\" , product:  \"Foo_Bar%3A1\" , serial:  \"SN001\"",
            "itBegin:  " + path + " , idx:  " + QString::number(start.size()) + " ,  " +
                QString::number(start.size() + 5) + " ,  " + QString::number(start.size() + 17),
            "Driver:  " + path,
        };
        QCOMPARE(log.lines(), expected);
    }

    void findTellsMissingFromEmpty()
    {
        RemoveDevice device(nullptr);
        QVector<QString> directories{"already there"};
        QCOMPARE(device.find("/run/nowhere/", directories), -1);
        QCOMPARE(device.find(m_root + '/' + kPhone + "/inner_SN001", directories), 0);
        QCOMPARE(directories, QVector<QString>{"already there"});
        QCOMPARE(device.find(m_root + '/' + kPhone, directories), 0);
        QCOMPARE(directories.mid(1), QVector<QString>{m_root + '/' + kPhone + "/inner_SN001"});
    }
};

QTEST_GUILESS_MAIN(TestRemoveDevice)
#include "test_removedevice.moc"

#include "buspeer.h"
#include "notify.h"
#include "processrecord.h"

#include <QDBusMessage>
#include <QtTest>

#include <unistd.h>

namespace
{

const QString kPath = QStringLiteral("/com/vantor/tarn/Notification");
const QString kInterface = QStringLiteral("com.vantor.tarn.Notification");

} // namespace

/// The object as a peer on the bus meets it, exported the way the session host does.
class TestNotify : public QObject
{
    Q_OBJECT

    Notification m_notification;
    BusPeer m_bus{kPath};
    QVector<QVariantList> m_heard;

public slots:
    void hear(const QDBusMessage& signal) { m_heard.append(signal.arguments()); }

private slots:
    void initTestCase()
    {
        QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only");
        QVERIFY(m_bus.host.registerObject(
            kPath, &m_notification, QDBusConnection::ExportScriptableSlots | QDBusConnection::ExportScriptableSignals));
        QVERIFY(m_bus.peer.connect(m_bus.host.baseService(), kPath, kInterface, "onMessage", this,
                                   SLOT(hear(QDBusMessage))));
    }

    void init() { m_heard.clear(); }

    void offersWhatItDescribes()
    {
        const QDBusMessage reply = m_bus.call("org.freedesktop.DBus.Introspectable", "Introspect");
        const QMap<QString, QStringList> live = BusPeer::members(reply.arguments().value(0).toString());
        const QMap<QString, QStringList> described =
            BusPeer::members(QString::fromUtf8(testfiles::read(ZENT_DATA_DIR "/com.vantor.tarn.Notification.xml")));
        QCOMPARE(described.keys(), QStringList{kInterface});
        QCOMPARE(described.value(kInterface).size(), 4);
        QCOMPARE(live.value(kInterface), described.value(kInterface));
        for (const QString& other : live.keys())
            QVERIFY2(other == kInterface || other.startsWith("org.freedesktop.DBus."), qPrintable(other));
    }

    void notifyIsHeardOnce_data()
    {
        QTest::addColumn<QVariantList>("arguments");
        QTest::newRow("all") << QVariantList{7, "zhangsan", QStringLiteral("标题"), "<b>text</b>\nmore", "admin"};
        QTest::newRow("empty") << QVariantList{0, "", "", "", ""};
        QTest::newRow("negative") << QVariantList{-1, "a@b", " ", "%1", "\""};
    }
    void notifyIsHeardOnce()
    {
        QFETCH(QVariantList, arguments);
        QSignalSpy emitted(&m_notification, &Notification::onMessage);
        QCOMPARE(m_bus.call(kInterface, "Notify", arguments).type(), QDBusMessage::ReplyMessage);
        QCOMPARE(static_cast<QVariantList>(emitted.value(0)), arguments);
        QTRY_VERIFY(!m_heard.isEmpty());
        QCOMPARE(m_bus.call(kInterface, "AgencyNotify", {"a", "b"}).type(), QDBusMessage::ReplyMessage);
        QCOMPARE(emitted.size(), 1);
        QCOMPARE(m_heard, QVector<QVariantList>{arguments});
    }

    void membersOfTheObjectStayHidden_data()
    {
        QTest::addColumn<QString>("method");
        QTest::newRow("deleteLater") << "deleteLater";
        QTest::newRow("destroyed") << "destroyed";
    }
    void membersOfTheObjectStayHidden()
    {
        QFETCH(QString, method);
        QCOMPARE(m_bus.call(kInterface, method).errorName(), QString("org.freedesktop.DBus.Error.UnknownMethod"));
    }

    void gioMountAnswersWhenGioHasRun()
    {
        const QString root = QString("/run/user/%1/gvfs/").arg(getuid());
        QVERIFY(QDir().mkpath(root + "mtp:host=A_B_SN1"));
        processrecord::clear();
        // Written at its end, so that an early answer would be seen.
        const QString ended = qEnvironmentVariable("ROOM") + "/gio.ended";
        testfiles::write(qEnvironmentVariable("ROOM") + "/standin/gio.hook", "sleep 0.3; : > " + ended.toUtf8());
        const QVariantList arguments{"A", "B", "SN1", QString::number(getuid())};
        QCOMPARE(m_bus.call(kInterface, "GioMount", arguments).type(), QDBusMessage::ReplyMessage);
        QVERIFY(QFile::exists(ended));
        QCOMPARE(processrecord::words(processrecord::entries("gio").value(0)),
                 QStringList({"mount", "-u", root + "mtp:host=A_B_SN1"}));
        testfiles::remove(root);
        QCOMPARE(m_bus.call(kInterface, "GioMount", arguments).type(), QDBusMessage::ReplyMessage);
        QCOMPARE(processrecord::entries("gio").size(), 1);
    }
};

QTEST_GUILESS_MAIN(TestNotify)
#include "test_notify.moc"

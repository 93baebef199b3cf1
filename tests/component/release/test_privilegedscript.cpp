#include "logcapture.h"
#include "processrecord.h"
#include "thirdscript.h"
#include "upgradepriority.h"

#include <QElapsedTimer>
#include <QProcess>
#include <QRegularExpression>
#include <QtTest>

namespace
{

const QString kFrontEnd = QStringLiteral("fenx-cli.bash");

/// The token as a shell with the usual tools makes it.
QString shellToken(const QString& script)
{
    QProcess shell;
    shell.start("/bin/sh",
                {"-c",
                 "printf %s \"$(printf %s \"kobaltrix_20191104${1}pemb_20191104\" | sha256sum | cut -c1-64)\""
                 " | sha256sum | cut -c1-64 | tr -d '\\n'",
                 "sh", script});
    return shell.waitForFinished() ? QString::fromLatin1(shell.readAllStandardOutput()) : QString();
}

/// How a runner is called and what must come of it.
struct Expected {
    int result;
    int starts;
    int pausesMs;
};

} // namespace

Q_DECLARE_METATYPE(Expected)

class TestPrivilegedScript : public QObject
{
    Q_OBJECT

    const QString m_standin = qEnvironmentVariable("ROOM") + "/standin/" + kFrontEnd;

    void plan(const char* what, const QByteArray& content) { testfiles::write(m_standin + what, content); }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }

    void init()
    {
        processrecord::clear();
        for (const char* what : {".rc", ".hook"})
            testfiles::remove(m_standin + what);
    }

    void wordsAndToken_data()
    {
        QTest::addColumn<QString>("script");
        QTest::addColumn<QStringList>("arguments");
        const QString script = QStringLiteral("/usr/share/lumo/restore_ldap.bash");
        QTest::newRow("path only") << script << QStringList();
        QTest::newRow("arguments") << script << QStringList{"-a", "", "two words", "--args", "$HOME"};
        QTest::newRow("another path") << script + "2" << QStringList();
        QTest::newRow("blank and quote") << "/opt/a b/it's \"x\".bash" << QStringList{"1"};
        QTest::newRow("Chinese") << QStringLiteral("/opt/脚本/恢复.bash") << QStringList{QStringLiteral("参数")};
        QTest::newRow("no path") << "" << QStringList();
    }
    void wordsAndToken()
    {
        QFETCH(QString, script);
        QFETCH(QStringList, arguments);
        const QString token = shellToken(script);
        QVERIFY(QRegularExpression("^[0-9a-f]{64}$").match(token).hasMatch());
        QCOMPARE(zent::thirdScriptArguments(script, arguments),
                 QStringList({"/opt/vantor/lumo/fenx/fenx-cli.bash", "--cmd", "thirdscript", "--thirdscript", script,
                              "--args", token}) +
                     arguments);
        // The real front end accepts the same words.
        QCOMPARE(UpgradePriority::GetInstance()->upgradeScript(QStringList{script} + arguments, true), 0);
        const QJsonObject entry = processrecord::entries(kFrontEnd).value(0);
        QCOMPARE(processrecord::words(entry), zent::thirdScriptArguments(script, arguments).mid(1));
        QVERIFY(entry.value("token_ok").toBool());
    }

    void attempts_data()
    {
        QTest::addColumn<bool>("detached");
        QTest::addColumn<bool>("flag");
        QTest::addColumn<QByteArray>("hook");
        QTest::addColumn<bool>("interpreter");
        QTest::addColumn<Expected>("expected");
        const QByteArray good;
        const QByteArray bad("echo 1 > $0.tmp; mv $0.tmp ${0%hook}rc");
        const QByteArray goodAtTheSecond(
            "if [ -e $0.seen ]; then echo 0 > ${0%hook}rc; else echo 7 > ${0%hook}rc; fi; : > $0.seen");
        QTest::newRow("once") << false << true << good << true << Expected{0, 1, 0};
        QTest::newRow("once, fails") << false << true << bad << true << Expected{1, 1, 0};
        QTest::newRow("once, no interpreter") << false << true << good << false << Expected{-2, 1, 0};
        QTest::newRow("repeated, good at once") << false << false << good << true << Expected{0, 1, 1000};
        QTest::newRow("repeated, good at the second")
            << false << false << goodAtTheSecond << true << Expected{0, 2, 3000};
        QTest::newRow("repeated, fails") << false << false << bad << true << Expected{1, 3, 6000};
        QTest::newRow("repeated, no interpreter") << false << false << good << false << Expected{-2, 3, 6000};
        QTest::newRow("detached, once") << true << false << good << true << Expected{1, 1, 1000};
        QTest::newRow("detached, failure unseen") << true << false << bad << true << Expected{1, 1, 1000};
        QTest::newRow("detached, no interpreter") << true << false << good << false << Expected{0, 1, 1000};
        QTest::newRow("detached, three times") << true << true << good << true << Expected{1, 3, 7000};
        QTest::newRow("detached, three times, no interpreter") << true << true << good << false << Expected{0, 1, 2000};
    }
    void attempts()
    {
        QFETCH(bool, detached);
        QFETCH(bool, flag);
        QFETCH(QByteArray, hook);
        QFETCH(bool, interpreter);
        QFETCH(Expected, expected);
        if (!hook.isEmpty())
            plan(".hook", hook);
        const QStringList list{"/usr/share/lumo/a.bash", "x"};
        UpgradePriority* runner = UpgradePriority::GetInstance();
        const QByteArray searchPath = qgetenv("PATH");
        if (!interpreter)
            qputenv("PATH", "/nowhere");
        LogCapture log;
        QElapsedTimer clock;
        clock.start();
        const int result = detached ? runner->upgradeScriptAsy(list, flag) : runner->upgradeScript(list, flag);
        const qint64 elapsed = clock.elapsed();
        qputenv("PATH", searchPath);

        QCOMPARE(result, expected.result);
        QVERIFY2(elapsed >= expected.pausesMs && elapsed < expected.pausesMs + 900,
                 qPrintable(QString::number(elapsed)));
        QTRY_COMPARE(processrecord::entries(kFrontEnd).size(), interpreter ? expected.starts : 0);
        // Started or not, each try has its line.
        QCOMPARE(log.count(QString(detached ? "upgradeScriptAsy" : "upgradeScript") + "  nRet: "), expected.starts);
    }

    void logInOrder()
    {
        LogCapture log;
        UpgradePriority::GetInstance()->upgradeScript({"/a", "x"}, true);
        QStringList lines{"strScriptPath: \"/a\"", "strScriptPath: \"x\"", "strList: \"x\""};
        for (const QString& word : zent::thirdScriptArguments("/a", {"x"}))
            lines.append("strCmdList: \"" + word + "\"");
        lines.append("nRet: 0");
        QCOMPARE(log.lines(), lines.replaceInStrings(QRegularExpression("^"), "upgradeScript  "));
    }
};

QTEST_GUILESS_MAIN(TestPrivilegedScript)
#include "test_privilegedscript.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "platformcontrol.h"
#include "scenes.h"
#include "timelimits.h"

#include <QSignalSpy>

using Interval = QPair<int, int>;

class TestScenes : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    const QString m_user = QStringLiteral("zhangsan");
    const QString m_file = QString("/home/%1/.cache/vantor/CurrentScene").arg(m_user);
    zent::Terminal m_terminal;
    QList<Interval> m_intervals;
    std::unique_ptr<Scenes> m_scenes;
    /// What the scenes say, in order.
    QStringList m_told;

    void read(const QStringList& names)
    {
        QJsonArray scenes;
        for (const QString& name : names)
            scenes.append(QJsonObject{{"scene_name", name}, {"scene_code", "code-" + name}});
        QByteArray body = QJsonDocument(QJsonObject{{"code", 0}, {"message", scenes}}).toJson();
        m_told.clear();
        QCOMPARE(m_scenes->analyseEvnData(&body), 1);
    }

private slots:
    void init()
    {
        m_terminal.read();
        m_intervals.clear();
        m_told.clear();
        m_platform.clearFaults();
        m_platform.clearRecord();
        // Intervals of a moment, and what was asked for instead.
        m_scenes = std::make_unique<Scenes>(m_terminal, m_user, nullptr, [this](int latest, int earliest) {
            m_intervals.append({latest, earliest});
            return 1;
        });
        m_scenes->start();
        connect(m_scenes.get(), &Scenes::choiceChanged, this,
                [this](bool offered) { m_told += offered ? "choice" : "no choice"; });
        connect(m_scenes.get(), &Scenes::namesAdded, this, [this](const QStringList& names) { m_told += names; });
        connect(m_scenes.get(), &Scenes::selected, this, [this](int index) { m_told += QString::number(index); });
    }
    void cleanup() { m_scenes.reset(); }

    void listsAddUp()
    {
        m_scenes->reverseEvn();
        QCOMPARE(m_scenes->currentCode(), QString("intranet-scene"));
        read({"a"});
        QCOMPARE(m_told, QStringList("no choice"));
        read({"b", "c"});
        QCOMPARE(m_told, QStringList({"choice", "b", "c", "0"}));
        // A second choice adds its scenes and selects nothing.
        read({"a", "d"});
        QCOMPARE(m_told, QStringList({"a", "d"}));
        QCOMPARE(m_scenes->count(), 5);
        // The first of a name counts.
        QCOMPARE(m_scenes->getEvncode("a"), 0);
        testfiles::write(m_file, "a long text from before");
        m_scenes->switchUserEvn("c");
        m_scenes->switchUserEvn("unknown");
        QCOMPARE(testfiles::read(m_file), QByteArray("code-c"));
        QCOMPARE(m_scenes->currentCode(), QString("code-c"));
        // Back in the box, where the first scene of the list is the third.
        m_told.clear();
        m_scenes->reverseEvn();
        m_scenes->startWithFirst();
        m_scenes->reverseEvn();
        QCOMPARE(m_told, QStringList({"1", "2"}));
    }

    void scenesAreAskedAgain_data() { fixture::addRows("sceneanswers.json"); }
    void scenesAreAskedAgain()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        m_platform.addFault({{"path", "/api/client/area/scenes"}}, row["reply"].toObject());
        const int limits = singleShots(30000);
        m_scenes->getAllUserEnvironment();
        QCOMPARE(singleShots(30000) - limits, 1);
        QTRY_VERIFY2(log.contains(row["line"].toString()), qPrintable(log.lines().join('\n')));
        QCOMPARE(m_intervals.contains(Interval(180000, 60000)), row["again"].toBool());
        // The policy is loaded once, although its time passes over and over.
        QCOMPARE(m_intervals.first(), Interval(60000, 30000));
        QCOMPARE(log.count("Call loadpolicy -1"), 1);
        fixture::findInLog(log, row["log"]);
        m_platform.clearFaults();
        if (row["again"].toBool())
            QTRY_COMPARE(m_scenes->count(), 3);
    }
};

QTEST_GUILESS_MAIN(TestScenes)
#include "test_scenes.moc"

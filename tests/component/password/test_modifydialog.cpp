// SPDX-License-Identifier: Apache-2.0
#include "boxcloser.h"
#include "fixture.h"
#include "modifydialog.h"
#include "platformcontrol.h"
#include "toolkitpasswordedit.h"

#include <QPointer>
#include <QPushButton>

namespace
{

const QString kOld = QStringLiteral("Zent@2026");
const QString kNew = QStringLiteral("Neu-%1\"\\密码8");

} // namespace

class TestModifyDialog : public QObject
{
    Q_OBJECT

    PlatformControl m_platform;
    BoxCloser m_boxes;
    const QByteArray m_info = testfiles::read(testfiles::kInfoFile);
    std::unique_ptr<LogCapture> m_log;
    std::unique_ptr<ModifyDialog> m_dialog;

    ToolkitPasswordEdit* edit(const char* name) const { return m_dialog->findChild<ToolkitPasswordEdit*>(name); }
    ToolkitPasswordEdit* old() const { return edit("oldPasswordEdit"); }
    ToolkitPasswordEdit* fresh() const { return edit("passwordEdit"); }
    ToolkitPasswordEdit* repeat() const { return edit("rePasswordEdit"); }
    QPushButton* confirm() const { return m_dialog->findChildren<QPushButton*>("confirm").value(0); }
    void fill(const QString& oldText, const QString& newText, const QString& repeated)
    {
        m_dialog->show();
        old()->setText(oldText);
        fresh()->setText(newText);
        repeat()->setText(repeated);
    }

    /// What was in the field after each thing that may restore a text.
    static QString broughtBack(ToolkitPasswordEdit* field)
    {
        QTest::keyClick(field, Qt::Key_R, Qt::ControlModifier);
        QString texts;
        for (const auto key : {QKeySequence::Undo, QKeySequence::Undo, QKeySequence::Redo}) {
            QTest::keySequence(field, key);
            texts += field->text();
        }
        return texts;
    }

private slots:
    void initTestCase() { QVERIFY2(qEnvironmentVariableIsSet("ROOM"), "runs inside a room only"); }
    void init()
    {
        m_platform.clearFaults();
        m_platform.clearRecord();
        testfiles::write(testfiles::kInfoFile, m_info);
        m_boxes.texts.clear();
        m_log = std::make_unique<LogCapture>();
        m_dialog = std::make_unique<ModifyDialog>();
        m_dialog->setUserName("zhangsan", "test-scene");
    }
    void cleanup()
    {
        for (const QString& secret : {kOld, kNew})
            QVERIFY(!m_log->contains(secret));
        m_dialog.reset();
        m_log.reset();
    }

    void passwordsReachTheServiceAsTyped()
    {
        fill(kOld, kNew, "other");
        repeat()->setFocus();
        QTest::keyClick(repeat(), Qt::Key_Return);
        QVERIFY(m_platform.record("dbus").isEmpty());
        repeat()->setText(kNew);
        QTest::keyClick(repeat(), Qt::Key_Return);
        QCOMPARE(m_platform.record("dbus").value(0).value("args"),
                 QJsonValue(QJsonArray({qEnvironmentVariable("USER"), kOld, kNew})));
        QVERIFY(m_dialog->isHidden());
        QCOMPARE(m_boxes.texts, QStringList());
        m_platform.patchState({{"users", QJsonObject{{"zhangsan", QJsonObject{{"password", kOld}}}}}});
    }

    void confirmNeedsTwoPasswordsAndARepetition()
    {
        fill("a", "b", "b");
        QVERIFY(confirm()->isEnabled());
        for (const QStringList& texts : {QStringList{"", "b", "b"}, {"a", "", ""}, {"a", "b", "c"}}) {
            fill(texts[0], texts[1], texts[2]);
            QVERIFY2(!confirm()->isEnabled(), qPrintable(texts.join(' ')));
        }
        fresh()->setText("c");
        QVERIFY(confirm()->isEnabled());
    }

    void serviceAnswers_data() { fixture::addRows("passwordanswers.json"); }
    void serviceAnswers()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        m_platform.addFault({{"dbus", "ModifyUserPassword"}}, row["action"].toObject());
        fill(kOld, kNew, kNew);
        confirm()->click();
        m_platform.patchState({{"services", QJsonObject{{"iam", true}}}});
        QCOMPARE(m_dialog->isHidden(), row["closes"].toBool());
        QCOMPARE(old()->alertMessage(), row["old"].toString());
        QCOMPARE(fresh()->alertMessage(), row["new"].toString());
        fixture::compare(QJsonArray::fromStringList(m_boxes.texts), row["boxes"]);
        QCOMPARE(repeat()->text(), row["closes"].toBool() ? QString() : kNew);
        fixture::compareLog(log, row["log"]);
    }

    void everyOpeningStartsEmpty()
    {
        for (const bool byKey : {true, false}) {
            m_dialog->show();
            for (ToolkitPasswordEdit* field : {old(), fresh(), repeat()})
                QTest::keyClicks(field, field == repeat() ? "abd" : "abc");
            m_dialog->onRepasswordeditFinished();
            QVERIFY(repeat()->isAlert());
            QCOMPARE(repeat()->alertMessage(), QStringLiteral("密码不一致"));
            if (byKey)
                QTest::keyClick(m_dialog.get(), Qt::Key_Escape);
            else
                m_dialog->close();
            QVERIFY(m_dialog->isHidden() && !repeat()->isAlert());
            QCOMPARE(repeat()->alertMessage(), QString());
            // Not only before the next opening: nothing typed stays in the memory of a closed dialog.
            QCOMPARE(old()->text() + fresh()->text() + repeat()->text(), QString());
            m_dialog->show();
            for (ToolkitPasswordEdit* field : {old(), fresh(), repeat()})
                QCOMPARE(broughtBack(field), QString());
        }
    }

    void minimumLengths_data() { fixture::addRows("passwordlengths.json"); }
    void minimumLengths()
    {
        QFETCH(QJsonObject, row);
        const QByteArray policy = row["policy"].toString().toUtf8();
        const int length = row["length"].toInt();
        const QString path = QStringLiteral("/usr/share/lumo/test-scene/pc_config.json");
        const auto fits = [this](int characters) {
            repeat()->setText(QString(characters, 'x'));
            return m_dialog->IsPasswordLenthValid();
        };
        for (const QByteArray& content : {QByteArray(R"({"pam_cracklib": {"minlen": 12}})"), policy}) {
            testfiles::write(path, content);
            m_dialog->IsPasswordLenthValid();
        }
        const LogCapture log;
        QVERIFY(fits(length) && (length == 0 || !fits(length - 1)));
        QFile::setPermissions(path, {});
        QVERIFY(fits(length));
        testfiles::remove(path);
        QCOMPARE(fits(length), length != 0);
        for (const QString& line : {QString("file open successfully!"), QString("file open failed!"),
                                    QString("no pc_config.json to use sceneCode: \"test-scene\""),
                                    QString("@@@@@@@@@@@@@: passwd limit : %1").arg(length)})
            QVERIFY2(log.contains(line), qPrintable(line));
    }

    void serverReplies_data() { fixture::addRows("passwordreplies.json"); }
    void serverReplies()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        const bool good = row["good"].toBool();
        m_dialog->show();
        QByteArray reply = row["body"].toString().toUtf8();
        QCOMPARE(m_dialog->analyseData(&reply), good);
        QCOMPARE(m_boxes.texts, QStringList{row["box"].toString()});
        QCOMPARE(m_dialog->isHidden(), good);
        QJsonObject expected = QJsonDocument::fromJson(m_info).object();
        if (row.contains("token"))
            expected["token"] = row["token"];
        QCOMPARE(QJsonDocument::fromJson(testfiles::read(testfiles::kInfoFile)).object(), expected);
        QTRY_COMPARE(m_platform.record("process").size(), good ? 1 : 0);
        QCOMPARE(m_platform.record("process").value(0).value("token_ok").toBool(), good);
        fixture::compareLog(log, row["log"]);
    }

    void repliesOfTheServerAreLogged()
    {
        QNetworkAccessManager manager;
        // Neither has a code.
        for (const char* path : {"state", "none"}) {
            const LogCapture log;
            QPointer<QNetworkReply> reply =
                manager.get(QNetworkRequest(QUrl(QString("http://127.0.0.1:9900/") + path)));
            QTRY_VERIFY(reply->isFinished());
            m_dialog->onPasswordChecked(reply);
            QTRY_VERIFY(!reply);
            const bool good = qstrcmp(path, "state") == 0;
            QCOMPARE(log.records(), good ? QStringList("debug parse config.json file failed.") : QStringList());
        }
        QCOMPARE(m_boxes.texts, QStringList({"修改密码失败", "修改密码失败"}));
    }

    void tokenWithoutAGoodFile_data() { fixture::addRows("tokenfailures.json"); }
    void tokenWithoutAGoodFile()
    {
        QFETCH(QJsonObject, row);
        const LogCapture log;
        const bool exists = row.contains("content");
        const QByteArray content = row["content"].toString().toUtf8();
        testfiles::remove(testfiles::kInfoFile);
        if (exists)
            testfiles::write(testfiles::kInfoFile, content);
        QFile::setPermissions(testfiles::kInfoFile,
                              QFile::Permissions(row["mode"].toInt(QFile::ReadOwner | QFile::WriteOwner)));
        m_dialog->renewToken("T");
        QCOMPARE(QFile::exists(testfiles::kInfoFile), exists);
        QCOMPARE(testfiles::read(testfiles::kInfoFile), content);
        testfiles::remove(testfiles::kInfoFile);
        QCOMPARE(m_boxes.texts, QStringList{row["box"].toString()});
        fixture::compareLog(log, row["log"]);
    }

    void dialogMayGoWhileANoticeIsOpen()
    {
        QByteArray body("{\"code\": 0, \"message\": \"T\"}");
        m_boxes.instead = [this] { m_dialog.reset(); };
        QVERIFY(m_dialog->analyseData(&body));
        QVERIFY(!m_dialog);
        QCOMPARE(m_boxes.texts.size(), 1);
    }
};

QTEST_MAIN(TestModifyDialog)
#include "test_modifydialog.moc"

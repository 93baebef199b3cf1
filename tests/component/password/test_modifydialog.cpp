// SPDX-License-Identifier: Apache-2.0
#include "modifydialog.h"
#include "toolkitpasswordedit.h"
#include "windowtest.h"

#include <QtWidgets>

namespace
{

const QString kOld = QStringLiteral("Zent@2026");
const QString kNew = QStringLiteral("Neu-%1\"\\密码8");

} // namespace

class TestModifyDialog : public WindowTest
{
    Q_OBJECT

    std::unique_ptr<ModifyDialog> m_dialog;

    ToolkitPasswordEdit* edit(const char* name) const { return m_dialog->findChild<ToolkitPasswordEdit*>(name); }
    ToolkitPasswordEdit* old() const { return edit("oldPasswordEdit"); }
    ToolkitPasswordEdit* fresh() const { return edit("passwordEdit"); }
    ToolkitPasswordEdit* repeat() const { return edit("rePasswordEdit"); }
    void fill(const QString& oldText, const QString& newText, const QString& repeated)
    {
        m_dialog->show();
        old()->setText(oldText);
        fresh()->setText(newText);
        repeat()->setText(repeated);
    }

private slots:
    void init()
    {
        startAnew();
        m_dialog = std::make_unique<ModifyDialog>();
        m_dialog->setUserName("zhangsan", "test-scene");
    }
    void cleanup()
    {
        for (const QString& secret : {kOld, kNew})
            QVERIFY(!m_log->contains(secret));
        m_dialog.reset();
    }

    void confirmNeedsTwoPasswordsAndARepetition()
    {
        const auto* confirm = m_dialog->findChildren<QPushButton*>("confirm").value(0);
        // From row to row one field changes.
        for (const QStringList& texts : {QStringList{"a", "b", "b", "ready"},
                                         {"", "b", "b", ""},
                                         {"a", "b", "b", "ready"},
                                         {"a", "b", "c", ""},
                                         {"a", "c", "c", "ready"},
                                         {"a", "", "c", ""},
                                         {"a", "", "", ""}}) {
            fill(texts[0], texts[1], texts[2]);
            QVERIFY2(confirm->isEnabled() == (texts[3] == "ready"), qPrintable(texts.join(' ')));
        }
    }

    void serviceAnswers_data() { fixture::addRows("passwordanswers.json"); }
    void serviceAnswers()
    {
        QFETCH(QJsonObject, row);
        m_platform.addFault({{"dbus", "ModifyUserPassword"}}, row["action"].toObject());
        fill(kOld, kNew, QString());
        for (const QString& repeated : {QString("other"), kNew}) {
            repeat()->setText(repeated);
            QTest::keyClick(repeat(), Qt::Key_Return);
        }
        QJsonArray passed;
        for (const QJsonObject& call : m_platform.record("dbus"))
            passed.append(call["args"]);
        fixture::compare(passed, QJsonArray{QJsonArray{qEnvironmentVariable("USER"), kOld, kNew}});
        m_platform.patchState({{"services", QJsonObject{{"iam", true}}},
                               {"users", QJsonObject{{"zhangsan", QJsonObject{{"password", kOld}}}}}});
        const bool closes = row["closes"].toBool();
        QVERIFY(m_dialog->isHidden() == closes && !repeat()->isAlert());
        fixture::compare(QJsonArray{old()->alertMessage(), fresh()->alertMessage()}, row["alerts"]);
        QCOMPARE(m_boxes.texts, row["boxes"].toVariant().toStringList());
        QCOMPARE(repeat()->text(), closes ? QString() : kNew);
        fixture::compareLog(*m_log, row["log"]);
    }

    void everyOpeningStartsEmpty()
    {
        const auto buttons = m_dialog->findChildren<QPushButton*>();
        const auto cancel =
            std::find_if(buttons.begin(), buttons.end(), [](auto* one) { return one->text() == "取消"; });
        const std::function<void()> ways[] = {[this] { QTest::keyClick(m_dialog.get(), Qt::Key_Escape); },
                                              [this] { m_dialog->close(); }, [cancel] { (*cancel)->click(); }};
        for (const auto& closeDialog : ways) {
            fill("abc", "abc", "abd");
            m_dialog->onRepasswordeditFinished();
            QVERIFY(repeat()->isAlert());
            QCOMPARE(repeat()->alertMessage(), QStringLiteral("密码不一致"));
            closeDialog();
            QVERIFY(m_dialog->isHidden() && !repeat()->isAlert());
            // Not only before the next opening: nothing typed stays in the memory of a closed dialog.
            QCOMPARE(repeat()->alertMessage() + old()->text() + fresh()->text() + repeat()->text(), QString());
        }
    }

    void minimumLengths_data() { fixture::addRows("passwordlengths.json"); }
    void minimumLengths()
    {
        QFETCH(QJsonObject, row);
        const QString path = QStringLiteral("/usr/share/lumo/test-scene/pc_config.json");
        QJsonArray shortest;
        for (const QString& content : {QString(R"({"pam_cracklib": {"minlen": 12}})"), row["policy"].toString(),
                                       QString("unreadable"), QString()}) {
            testfiles::remove(path);
            if (!content.isEmpty())
                testfiles::write(path, content.toUtf8());
            if (content == "unreadable")
                QFile::setPermissions(path, {});
            int length = 0;
            for (repeat()->clear(); length < 50 && !m_dialog->IsPasswordLenthValid(); ++length)
                repeat()->insert("x");
            shortest.append(length);
        }
        fixture::compare(shortest, row["shortest"]);
        QStringList lines = m_log->records();
        lines.removeDuplicates();
        fixture::compareLines(lines, row["log"]);
    }

    void serverReplies_data() { fixture::addRows("passwordreplies.json"); }
    void serverReplies()
    {
        QFETCH(QJsonObject, row);
        testfiles::remove(testfiles::kInfoFile);
        if (row.contains("file"))
            testfiles::write(testfiles::kInfoFile, row["file"].toString().toUtf8());
        QFile::setPermissions(testfiles::kInfoFile,
                              QFile::Permissions(row["mode"].toInt(QFile::ReadOwner | QFile::WriteOwner)));
        m_platform.addFault({{"path", "/any"}}, row["reply"].toObject());
        QNetworkAccessManager manager;
        QPointer<QNetworkReply> reply = manager.get(QNetworkRequest(QUrl("http://server.zent.test/any")));
        QTRY_VERIFY(reply->isFinished());
        m_dialog->show();
        m_dialog->onPasswordChecked(reply);
        QTRY_VERIFY(!reply);
        QCOMPARE(m_boxes.texts, row["boxes"].toVariant().toStringList());
        const QString written = QString::fromUtf8(testfiles::read(testfiles::kInfoFile));
        QCOMPARE(written, row.value("written").toString(row.value("file").toString()));
        const bool good = row["good"].toBool();
        QCOMPARE(m_dialog->isHidden(), good);
        QTRY_COMPARE(m_platform.record("process").size(), good ? 1 : 0);
        QCOMPARE(m_platform.record("process").value(0).value("token_ok").toBool(), good);
        fixture::compareLog(*m_log, row["log"]);
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

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "toolkitapplication.h"
#include "toolkitdialog.h"
#include "toolkitpasswordedit.h"
#include "widgets.h"

#include <QtWidgets>

class TestToolkitDialog : public QObject
{
    Q_OBJECT

private slots:
    void returnPressesNoButtonAndAListenerMayDeleteTheDialog()
    {
        auto* doomed = new ToolkitDialog;
        auto* edit = new ToolkitPasswordEdit;
        doomed->addContent(edit);
        doomed->addButton("确定");
        QSignalSpy others(doomed, &ToolkitDialog::buttonClicked);
        connect(doomed, &ToolkitDialog::buttonClicked, this, [doomed] { delete doomed; });
        QVERIFY(shown(*doomed));
        QTest::keyClick(edit, Qt::Key_Return);
        QCOMPARE(others.count(), 0);
        doomed->buttons().constFirst()->click();
        QCOMPARE(others.count(), 1);
    }

    void messagesAreLiteralAndWhole_data() { fixture::addRows("messages.json"); }
    void messagesAreLiteralAndWhole()
    {
        QFETCH(QJsonObject, row);
        const QString message = row["begin"].toString() + row["text"].toString().repeated(row["times"].toInt(1));
        ToolkitDialog dialog;
        auto* label = dialog.findChild<QLabel*>("messageLabel");
        label->setFont(font(14));
        dialog.setMessage(message);
        dialog.addButton("确定", true);
        QVERIFY(shown(dialog));
        QCOMPARE(dialog.message(), message);
        QTest::mouseClick(label, Qt::LeftButton);
        QTest::keyClick(label, Qt::Key_A, Qt::ControlModifier);
        QTest::keyClick(label, Qt::Key_C, Qt::ControlModifier);
        const QString copied = QGuiApplication::clipboard()->text();
        QVERIFY(message == copied || message.startsWith(copied.left(copied.size() - 1)));
        // A combining mark and the second half of a pair stay where they are.
        QJsonArray pieces;
        for (const QString& piece : label->text().split(QChar(0x200b)))
            pieces.append(piece.size());
        QJsonObject got{{"pieces", pieces}, {"copied", copied.size()}, {"end", copied.right(1)}};
        if (row["shown"].toObject().contains("width"))
            got["width"] = label->width();
        fixture::compare(got, row["shown"]);
        QVERIFY(!label->geometry().intersects(dialog.buttons().constFirst()->geometry()));
        // The menu copies the whole message while nothing is selected.
        label->setSelection(0, 0);
        label->actions().constFirst()->trigger();
        QCOMPARE(QGuiApplication::clipboard()->text(), message);
        if (row.contains("larger")) {
            QLabel plain(label->text());
            plain.setFont(label->font());
            plain.setWordWrap(true);
            QCOMPARE(label->height(), plain.heightForWidth(label->width()) + 20);
            label->setFont(font(20));
            QCOMPARE(label->width(), row["larger"].toInt());
        }
        dialog.setMessage("");
        QVERIFY(!label->isVisible());
    }

    void hiddenPasswordStaysInside()
    {
        const QString secret = "S3cret&";
        ToolkitDialog dialog;
        auto* edit = new ToolkitPasswordEdit;
        dialog.addContent(edit);
        QVERIFY(shown(dialog));
        QClipboard* clipboard = QGuiApplication::clipboard();
        clipboard->setText("before");
        edit->setText(secret);
        edit->selectAll();
        QTest::keyClick(edit, Qt::Key_C, Qt::ControlModifier);
        QTest::keyClick(edit, Qt::Key_X, Qt::ControlModifier);
        QCOMPARE(clipboard->text() + edit->text(), "before" + secret);
        QVERIFY(!edit->displayText().contains(secret) && !edit->dragEnabled());

        auto* echoButton = edit->findChild<QAbstractButton*>("echoButton");
        QTest::mouseClick(echoButton, Qt::LeftButton);
        QCOMPARE(edit->displayText(), secret);
        QTest::keyClick(edit, Qt::Key_X, Qt::ControlModifier);
        QCOMPARE(clipboard->text() + edit->text(), secret);
        edit->setText(secret);
        edit->setClearIcon(QIcon(QPixmap(8, 8)));
        QTest::mouseClick(edit->findChild<QAbstractButton*>("clearButton"), Qt::LeftButton);
        QTest::keySequence(edit, QKeySequence::Undo);
        QCOMPARE(edit->text(), QString());
        edit->setText(secret);
        // A dialog shown again must not show what was revealed before.
        dialog.hide();
        QVERIFY(!edit->displayText().contains(secret));
    }

    void dialogChoosesItsFocus()
    {
        ToolkitDialog dialog;
        QVERIFY(shown(dialog));
        QCOMPARE(dialog.focusWidget()->objectName(), "titlebarCloseButton");
        dialog.hide();
        for (const char* name : {"disabled", "hidden", "clicked", "first", "second"}) {
            auto* edit = new QLineEdit;
            edit->setObjectName(name);
            edit->setEnabled(*name != 'd');
            edit->setFocusPolicy(*name == 'c' ? Qt::ClickFocus : Qt::StrongFocus);
            dialog.addContent(edit);
            edit->setHidden(*name == 'h');
        }
        auto* other = new QPushButton;
        dialog.addContent(other);
        // Shows the dialog again, and returns what has the focus.
        const auto focus = [&dialog](QWidget* former) {
            dialog.hide();
            former->clearFocus();
            return shown(dialog) ? dialog.focusWidget() : nullptr;
        };
        QCOMPARE(focus(dialog.focusWidget())->objectName(), "first");
        QVERIFY(!other->autoDefault());
        for (const int index : {0, 1})
            QCOMPARE(dialog.addButton("a", index == 1), index);
        dialog.setWindowFlags(Qt::Widget);
        QCOMPARE(focus(dialog.focusWidget()), dialog.buttons()[1]);
        QVERIFY(dialog.windowFlags().testFlag(Qt::FramelessWindowHint) && dialog.isWindow());
        dialog.setTitle("title");
        QVERIFY(dialog.accessibleName().isEmpty());
        dialog.setTitle("");
        dialog.setMessage("message");
        QCOMPARE(dialog.accessibleName() + dialog.accessibleDescription(), "message");
        const QSignalSpy chosen(&dialog, &ToolkitDialog::buttonClicked);
        QTest::keyClick(&dialog, Qt::Key_Enter);
        QCOMPARE(chosen.count(), 1);
        QCOMPARE(dialog.result(), 1);
        QVERIFY(shown(dialog));
        QTest::keyClick(&dialog, Qt::Key_Escape);
        QVERIFY(!dialog.isVisible());
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestToolkitDialog test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_toolkitdialog.moc"

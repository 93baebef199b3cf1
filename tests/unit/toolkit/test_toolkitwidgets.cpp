#include "toolkitapplication.h"
#include "toolkitdialog.h"
#include "toolkitpasswordedit.h"

#include <QAbstractButton>
#include <QClipboard>
#include <QLabel>
#include <QSignalSpy>
#include <QtTest>

namespace
{

bool shown(QWidget& window)
{
    window.show();
    return QTest::qWaitForWindowActive(&window);
}

} // namespace

class TestToolkitWidgets : public QObject
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

    void messageIsLiteralAndWhole()
    {
        for (const QString& message : {QString("<b>错误</b>"), "https://" + QString(300, 'a'), QString(500, '\n')}) {
            ToolkitDialog dialog;
            dialog.setMessage(message);
            dialog.addButton("确定", true);
            QVERIFY(shown(dialog));
            QCOMPARE(dialog.message(), message);
            auto* label = dialog.findChild<QLabel*>("messageLabel");
            QCOMPARE(label->textFormat(), Qt::PlainText);
            QVERIFY(dialog.width() >= 300 && dialog.width() < 500 && dialog.height() < 1200);
            QVERIFY(!label->geometry().intersects(dialog.buttons().constFirst()->geometry()));
        }
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
        // A dialog shown again must not show what was revealed before.
        dialog.hide();
        QVERIFY(!edit->displayText().contains(secret));
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestToolkitWidgets test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_toolkitwidgets.moc"

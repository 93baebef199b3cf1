// SPDX-License-Identifier: Apache-2.0
#include "toolkitapplication.h"
#include "toolkitdialog.h"
#include "toolkitpasswordedit.h"
#include "toolkittitlebar.h"

#include <QAbstractButton>
#include <QClipboard>
#include <QLabel>
#include <QMouseEvent>
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
            QTest::mouseClick(label, Qt::LeftButton);
            QTest::keyClick(label, Qt::Key_A, Qt::ControlModifier);
            QTest::keyClick(label, Qt::Key_C, Qt::ControlModifier);
            QCOMPARE(QGuiApplication::clipboard()->text(),
                     message.count('\n') < 20 ? message : QString(19, '\n') + "…");
        }
    }

    void titleBarDragsItsWindow()
    {
        QWidget window;
        auto* bar = new ToolkitTitlebar(&window);
        QVERIFY(shown(window));
        window.move(100, 100);
        const QSignalSpy dragged(bar, &ToolkitTitlebar::windowDragged);
        const auto mouse = [bar](QEvent::Type type, const QPoint& place, Qt::MouseButton button = Qt::NoButton) {
            QMouseEvent event(type, bar->mapFromGlobal(place), place, button, Qt::LeftButton, Qt::NoModifier);
            QApplication::sendEvent(bar, &event);
        };
        mouse(QEvent::MouseMove, {200, 200});
        mouse(QEvent::MouseButtonPress, {110, 110}, Qt::RightButton);
        mouse(QEvent::MouseMove, {200, 200});
        mouse(QEvent::MouseButtonPress, {110, 110}, Qt::LeftButton);
        mouse(QEvent::MouseMove, QPoint(109 + QApplication::startDragDistance(), 110));
        QCOMPARE(window.pos(), QPoint(100, 100));
        QCOMPARE(dragged.count(), 0);
        mouse(QEvent::MouseMove, {150, 140});
        mouse(QEvent::MouseMove, {160, 150});
        mouse(QEvent::MouseButtonRelease, {160, 150}, Qt::LeftButton);
        mouse(QEvent::MouseMove, {200, 200});
        QCOMPARE(window.pos(), QPoint(150, 140));
        QCOMPARE(dragged.count(), 1);
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
        edit->setClearIcon(QIcon(QPixmap(8, 8)));
        QTest::mouseClick(edit->findChild<QAbstractButton*>("clearButton"), Qt::LeftButton);
        QTest::keySequence(edit, QKeySequence::Undo);
        QCOMPARE(edit->text(), QString());
        edit->setText(secret);
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

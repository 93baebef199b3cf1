// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "toolkitblurframe.h"
#include "toolkitdialog.h"
#include "toolkitpasswordedit.h"
#include "toolkitpushbutton.h"
#include "toolkittitlebar.h"
#include "widgets.h"

#include <QtWidgets>

/// How the widgets of the toolkit behave.
class TestToolkitWidgets : public QObject
{
    Q_OBJECT

private slots:
    void titleBarDragsItsWindow()
    {
        QWidget window;
        auto* bar = new ToolkitTitlebar(&window);
        QVERIFY(shown(window));
        window.move(100, 100);
        const QSignalSpy dragged(bar, &ToolkitTitlebar::windowDragged);
        const int far = QApplication::startDragDistance();
        const auto kPress = QEvent::MouseButtonPress, kMove = QEvent::MouseMove, kRelease = QEvent::MouseButtonRelease;
        // What the mouse does where, whether the bar takes it, and how far it has taken the window.
        const std::tuple<QEvent::Type, Qt::MouseButton, QPoint, bool, QPoint> steps[] = {
            {kMove, Qt::NoButton, {200, 200}, false, {0, 0}},
            {kPress, Qt::RightButton, {110, 110}, false, {0, 0}},
            {kMove, Qt::NoButton, {200, 200}, false, {0, 0}},
            {kPress, Qt::LeftButton, {110, 110}, true, {0, 0}},
            {kMove, Qt::NoButton, {110, 109 + far}, true, {0, 0}},
            {kMove, Qt::NoButton, {110, 110 + far}, true, {0, far}},
            {kMove, Qt::NoButton, {111, 110}, true, {1, 0}},
            {kRelease, Qt::LeftButton, {111, 110}, false, {1, 0}},
            {kMove, Qt::NoButton, {200, 200}, false, {1, 0}}};
        for (const auto& [type, button, place, taken, moved] : steps) {
            QMouseEvent event(type, bar->mapFromGlobal(place), place, button, Qt::LeftButton, Qt::NoModifier);
            QApplication::sendEvent(bar, &event);
            QCOMPARE(event.isAccepted(), taken);
            QCOMPARE(window.pos(), QPoint(100, 100) + moved);
        }
        QCOMPARE(dragged.count(), 1);
    }

    void alertsAreBubbles_data() { fixture::addRows("alerts.json"); }
    void alertsAreBubbles()
    {
        QFETCH(QJsonObject, row);
        QWidget window;
        window.setFont(font(16));
        window.setGeometry(rect(row["window"]));
        ToolkitLineEdit edit(&window);
        edit.setGeometry(rect(row["field"]));
        edit.setText(row["typed"].toString());
        QVERIFY(shown(window));
        edit.showAlertMessage("before");
        edit.showAlertMessage(row["message"].toString(), row["ms"].toInt(3000));
        const auto* timer = edit.findChild<QTimer*>(QString(), Qt::FindDirectChildrenOnly);
        QCOMPARE(timer->isActive(), row["ms"].toInt(3000) > 0);
        auto* bubble = window.findChildren<QLabel*>("alertBubble").last();
        QCOMPARE(edit.alertMessage(), row["message"].toString());
        QCOMPARE(bubble->text(), row["shown"].toString(row["message"].toString()));
        const QRect field = edit.geometry();
        const QRect got = bubble->geometry();
        QVERIFY(bubble->isVisible() && window.rect().contains(got) && window.children().last() == bubble);
        QCOMPARE(bubble->grab().toImage().pixelColor(got.width() / 2, 2), QColor(0xb3, 0x26, 0x1e));
        const bool inside = field.contains(got) && got.center().y() == field.center().y();
        const QMap<int, const char*> places{{field.bottom() + 5, "below"}, {field.top() - 4 - got.height(), "above"}};
        const QString place = inside ? "inside" : places.value(got.top());
        fixture::compare(QJsonArray{place, got.left(), got.width()}, row["bubble"]);
        edit.setText("a text so long that no bubble has room behind it");
        QVERIFY(!field.contains(bubble->geometry()));
        edit.move(field.x() + 3, field.y());
        QCOMPARE(bubble->x(), field.x() + 3);
        // A new layout places it again, after it has been applied.
        for (const auto event : {QEvent::LayoutRequest, QEvent::User}) {
            bubble->move(0, 0);
            QApplication::postEvent(&window, new QEvent(event));
            QTest::qWait(0);
            QCoreApplication::sendPostedEvents();
            QCOMPARE(bubble->x(), event == QEvent::LayoutRequest ? field.x() + 3 : 0);
        }
        edit.hideAlertMessage();
        QVERIFY(!bubble->isVisible() && edit.alertMessage().isEmpty() && !timer->isActive());
    }

    void fieldsTellTheirAlerts()
    {
        QWidget window;
        ToolkitPasswordEdit edit(&window);
        QVERIFY(shown(window));
        const QSignalSpy alerts(&edit, &ToolkitLineEdit::alertChanged);
        edit.setAlert(true);
        edit.setAlert(true);
        QVERIFY(edit.isAlert() && alerts.count() == 1);
        auto* doomed = new ToolkitLineEdit(&window);
        doomed->showAlertMessage("wrong");
        const QPointer<QLabel> bubble = window.findChild<QLabel*>("alertBubble");
        delete doomed;
        QVERIFY(!bubble);
        // A window that only the desktop hides keeps the bubble.
        edit.showAlertMessage("wrong");
        for (const bool spontaneous : {true, false}) {
            QHideEvent hidden;
            if (spontaneous)
                QSpontaneKeyEvent::setSpontaneous(&hidden);
            QVERIFY(qApp->notify(&edit, &hidden));
            QCOMPARE(edit.alertMessage(), spontaneous ? "wrong" : "");
        }
        // Keys that mean nothing to the field are its window's.
        QKeyEvent released(QEvent::KeyRelease, Qt::Key_A, Qt::NoModifier);
        QApplication::sendEvent(&edit, &released);
        QVERIFY(!released.isAccepted());
    }

    void frameKnowsItsKeys()
    {
        ToolkitBlurFrame frame;
        auto* edit = new QLineEdit(&frame);
        auto* button = new ToolkitPushButton("一", &frame);
        auto* panel = new ToolkitBlurFrame(&frame);
        QCOMPARE(QAccessible::queryAccessibleInterface(&frame)->role(), QAccessible::Window);
        QVERIFY(QAccessible::queryAccessibleInterface(panel)->role() != QAccessible::Window);
        const QSignalSpy clicked(button, &QAbstractButton::clicked);
        QVERIFY(shown(frame));
        panel->setFocusPolicy(Qt::StrongFocus);
        const std::tuple<QWidget*, Qt::Key, int, bool> rows[] = {{edit, Qt::Key_Return, 0, false},
                                                                 {button, Qt::Key_Return, 1, true},
                                                                 {button, Qt::Key_Enter, 2, true},
                                                                 {button, Qt::Key_A, 2, false},
                                                                 {panel, Qt::Key_Escape, 2, true}};
        for (const auto& [focused, key, clicks, taken] : rows) {
            focused->setFocus();
            QKeyEvent event(QEvent::KeyPress, key, Qt::NoModifier);
            QApplication::sendEvent(focused == panel ? panel : &frame, &event);
            QCOMPARE(event.isAccepted(), taken);
            QCOMPARE(clicked.count(), clicks);
        }
        QVERIFY(!frame.isVisible() && panel->isVisibleTo(&frame));
    }

    void returnPressesNoButtonAndAListenerMayDeleteTheDialog()
    {
        auto* doomed = new ToolkitDialog;
        auto* edit = new ToolkitPasswordEdit;
        doomed->addContent(edit);
        doomed->addButton("确定");
        const QSignalSpy others(doomed, &ToolkitDialog::buttonClicked);
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
        QTest::keySequence(label, QKeySequence("Ctrl+A, Ctrl+C"));
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

    void dialogChoosesItsFocus()
    {
        ToolkitDialog dialog;
        QVERIFY(shown(dialog));
        QCOMPARE(dialog.focusWidget()->objectName(), "titlebarCloseButton");
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
        const auto focus = [&dialog] {
            dialog.hide();
            dialog.focusWidget()->clearFocus();
            return shown(dialog) ? dialog.focusWidget() : nullptr;
        };
        QCOMPARE(focus()->objectName(), "first");
        QVERIFY(!other->autoDefault());
        for (const int index : {0, 1})
            QCOMPARE(dialog.addButton("a", index == 1), index);
        dialog.setWindowFlags(Qt::Widget);
        QCOMPARE(focus(), dialog.buttons()[1]);
        QVERIFY(dialog.windowFlags().testFlag(Qt::FramelessWindowHint) && dialog.isWindow());
        const QSignalSpy chosen(&dialog, &ToolkitDialog::buttonClicked);
        QTest::keyClick(&dialog, Qt::Key_Enter);
        QCOMPARE(chosen.count(), 1);
        QCOMPARE(dialog.result(), 1);
        QVERIFY(shown(dialog));
        QTest::keyClick(&dialog, Qt::Key_Escape);
        QVERIFY(!dialog.isVisible());
    }
};

QTEST_MAIN(TestToolkitWidgets)
#include "test_toolkitwidgets.moc"

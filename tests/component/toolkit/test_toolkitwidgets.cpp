// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "toolkitapplication.h"
#include "toolkitblurframe.h"
#include "toolkitbuttonbox.h"
#include "toolkitcombobox.h"
#include "toolkitdialog.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"

#include <QAbstractButton>
#include <QAction>
#include <QClipboard>
#include <QHelpEvent>
#include <QLabel>
#include <QMenu>
#include <QMouseEvent>
#include <QPushButton>
#include <QSignalSpy>
#include <QTimer>
#include <QToolButton>
#include <QToolTip>

namespace
{

bool shown(QWidget& window)
{
    window.show();
    return QTest::qWaitForWindowActive(&window);
}

/// What pointing at the widget shows.
QString toolTip(QWidget& widget)
{
    QHelpEvent event(QEvent::ToolTip, QPoint(1, 1), QPoint(1, 1));
    QApplication::sendEvent(&widget, &event);
    return event.isAccepted() ? QToolTip::text() : QString();
}

QFont font(int pixels)
{
    QFont font;
    font.setPixelSize(pixels);
    return font;
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
            // The menu copies the whole message while nothing is selected.
            label->setSelection(0, 0);
            QCOMPARE(label->actions().constFirst()->text(), QString("复制"));
            label->actions().constFirst()->trigger();
            QCOMPARE(QGuiApplication::clipboard()->text(), message);
        }
    }

    void longWordsAreBroken()
    {
        // A combining mark and the second half of a pair stay where they are.
        const std::pair<QString, QList<int>> rows[] = {{QString(24, 'a'), {24}},
                                                       {QString(25, 'a'), {24, 1}},
                                                       {QString(49, 'a'), {24, 24, 1}},
                                                       {QString(23, 'a') + " " + QString(24, 'a'), {48}},
                                                       {QString('a') + QString("𝐀").repeated(13), {25, 2}},
                                                       {QString(24, 'a') + QChar(0x301) + "a", {25, 1}}};
        for (const auto& [message, pieces] : rows) {
            ToolkitDialog dialog;
            dialog.setMessage(message);
            QList<int> got;
            for (const QString& piece : dialog.findChild<QLabel*>("messageLabel")->text().split(QChar(0x200b)))
                got.append(piece.size());
            QCOMPARE(got, pieces);
        }
    }

    void buttonsFitTheirTexts()
    {
        const std::tuple<const char*, int, int> rows[] = {{"", 14, 80}, {"终端", 14, 80}, {"终端别名终端", 14, 116}};
        for (const auto& [text, pixels, width] : rows) {
            ToolkitSuggestButton button(text);
            button.setFont(font(pixels));
            QCOMPARE(button.sizeHint(), QSize(width, 36));
        }
        ToolkitPushButton button("█");
        button.setFont(font(100));
        const int line = button.fontMetrics().height();
        QCOMPARE(button.sizeHint(), QSize(button.fontMetrics().size(0, "█").width() + 32, line + 12));
        QCOMPARE(button.minimumSizeHint(), QSize(0, line + 4));
        ToolkitSuggestButton accented("█");
        const QPalette palette = ThemeHelper::palette(ThemeHelper::LightType);
        for (QPushButton* one : {static_cast<QPushButton*>(&button), static_cast<QPushButton*>(&accented)}) {
            one->setPalette(palette);
            one->setFont(font(100));
            one->resize(one->sizeHint());
            const auto ink = [one] { return one->grab().toImage().pixelColor(one->rect().center()); };
            QCOMPARE(ink(), one == &accented ? QColor(Qt::white) : palette.color(QPalette::ButtonText));
            one->setEnabled(false);
            QCOMPARE(ink(), palette.color(QPalette::Disabled, QPalette::ButtonText));
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

    void passwordEditOffersItsSigns()
    {
        ToolkitPasswordEdit edit;
        auto* echo = edit.findChild<QAbstractButton*>("echoButton");
        auto* clear = edit.findChild<QAbstractButton*>("clearButton");
        edit.resize(200, 36);
        QVERIFY(shown(edit));
        const auto hints = [&edit] { return int(edit.inputMethodHints()); };
        constexpr int kSecret = Qt::ImhSensitiveData | Qt::ImhNoPredictiveText | Qt::ImhNoAutoUppercase;
        QCOMPARE(hints(), kSecret | Qt::ImhHiddenText);
        QCOMPARE(echo->toolTip() + echo->accessibleDescription(), QString("显示密码 (Ctrl+R)Ctrl+R"));
        QTest::keyClick(&edit, Qt::Key_R, Qt::ControlModifier);
        QCOMPARE(hints(), kSecret);
        QCOMPARE(echo->accessibleName() + echo->isChecked(), QString("隐藏密码") + true);
        QVERIFY(!edit.testAttribute(Qt::WA_InputMethodEnabled) && !clear->isVisible());
        edit.setText("secret");
        QVERIFY(!clear->isVisible());
        edit.setClearIcon(QIcon(QPixmap(8, 8)));
        QVERIFY(clear->isVisible());
        QCOMPARE(clear->accessibleName(), QString("清空"));
        QCOMPARE(echo->geometry(), QRect(168, 4, 28, 28));
        QCOMPARE(clear->geometry(), QRect(140, 4, 28, 28));
        QCOMPARE(edit.textMargins(), QMargins(8, 0, 60, 0));
        edit.setEchoButtonVisible(false);
        QCOMPARE(edit.echoMode(), QLineEdit::Password);
        QTest::keyClick(&edit, Qt::Key_R, Qt::ControlModifier);
        QCOMPARE(edit.echoMode(), QLineEdit::Password);
        edit.resize(180, 40);
        QCOMPARE(clear->pos(), QPoint(148, 6));
        QCOMPARE(edit.textMargins().right(), 32);
        edit.clear();
        QVERIFY(!clear->isVisible());
        QCOMPARE(edit.textMargins().right(), 8);
    }

    void alertsAreBubbles_data() { fixture::addRows("alerts.json"); }
    void alertsAreBubbles()
    {
        QFETCH(QJsonObject, row);
        const auto numbers = [&row](const char* key) { return row[key].toVariant().value<QVariantList>(); };
        QWidget window;
        window.setFont(font(16));
        window.resize(numbers("window")[0].toInt(), numbers("window")[1].toInt());
        ToolkitLineEdit edit(&window);
        QList<QVariant> place = numbers("field");
        edit.setGeometry(place[0].toInt(), place[1].toInt(), place[2].toInt(), place[3].toInt());
        edit.setText(row["typed"].toString());
        QVERIFY(shown(window));
        edit.showAlertMessage("before");
        edit.showAlertMessage(row["message"].toString(), row["ms"].toInt(3000));
        const auto* timer = edit.findChild<QTimer*>(QString(), Qt::FindDirectChildrenOnly);
        QCOMPARE(timer->isActive(), row["ms"].toInt(3000) > 0);
        const auto* bubble = window.findChildren<QLabel*>("alertBubble").last();
        QCOMPARE(edit.alertMessage(), row["message"].toString());
        QCOMPARE(bubble->text(), row["shown"].toString(row["message"].toString()));
        const QRect field = edit.geometry();
        const QRect got = bubble->geometry();
        QVERIFY(bubble->isVisible() && window.rect().contains(got));
        if (row.contains("width"))
            QCOMPARE(got.width(), row["width"].toInt());
        const bool inside = field.contains(got);
        QCOMPARE(inside                            ? "inside"
                 : got.top() == field.bottom() + 5 ? "below"
                 : got.bottom() == field.top() - 5 ? "above"
                                                   : "",
                 row["place"].toString());
        QVERIFY(inside ? got.right() == field.right() - 8 && got.center().y() == field.center().y()
                       : got.left() == field.left());
        edit.setText("a text so long that no bubble has room behind it");
        QCOMPARE(field.contains(bubble->geometry()), false);
        edit.move(field.x() + 3, field.y());
        QCOMPARE(bubble->x(), field.x() + 3);
        edit.hideAlertMessage();
        QVERIFY(!bubble->isVisible() && edit.alertMessage().isEmpty() && !timer->isActive());
    }

    void spinnerTurnsOnlyWhileSeen()
    {
        ToolkitSpinner spinner;
        const auto* timer = spinner.findChild<QTimer*>();
        const std::pair<std::function<void()>, bool> steps[] = {
            {[&] { spinner.start(); }, false}, {[&] { spinner.show(); }, true},  {[&] { spinner.hide(); }, false},
            {[&] { spinner.show(); }, true},   {[&] { spinner.stop(); }, false}, {[&] { spinner.start(); }, true}};
        for (const auto& [step, turns] : steps) {
            step();
            QCOMPARE(timer->isActive(), turns);
        }
        QCOMPARE(timer->interval(), 80);
        QCOMPARE(spinner.sizeHint(), QSize(20, 20));
        QCOMPARE(spinner.accessibleName(), QString("正在处理"));
    }

    void labelsFit()
    {
        ToolkitLabel label(QString("终端别名终端别名"));
        label.setFont(font(14));
        // Chinese glyphs are as wide as the font is high.
        for (const auto& [width, pixels] :
             std::initializer_list<std::pair<int, int>>{{112, 14}, {111, 13}, {96, 12}, {95, 11}, {20, 8}}) {
            label.setFont(font(14));
            label.resize(width, 18);
            label.shrinkFontToWidth();
            QCOMPARE(label.font().pixelSize(), label.isVisible() ? pixels : 14);
            label.show();
            QCOMPARE(label.font().pixelSize(), pixels);
        }
        const std::tuple<int, bool, const char*> rows[] = {
            {200, false, ""}, {20, true, ""}, {20, false, "终端别名终端别名"}};
        for (const auto& [width, wraps, tip] : rows) {
            label.resize(width, 18);
            label.setWordWrap(wraps);
            QCOMPARE(toolTip(label), QString(tip));
        }
        label.setToolTip("own");
        QCOMPARE(toolTip(label), "own");
        QCOMPARE(ToolkitLabel::plainToolTip("a < b"), "a < b");
        QCOMPARE(ToolkitLabel::plainToolTip("<b>a</b>"), "&lt;b&gt;a&lt;/b&gt;");
        ToolkitComboBox box;
        box.addItem("a scene of a long name");
        box.resize(60, 36);
        QVERIFY(shown(box));
        QCOMPARE(toolTip(box), "a scene of a long name");
        box.resize(400, 36);
        QCOMPARE(toolTip(box), QString());
    }

    void segmentsAreReplaced()
    {
        ToolkitButtonBox box;
        QSignalSpy clicked(&box, &ToolkitButtonBox::buttonClicked);
        const auto make = [&box] { return new ToolkitButtonBoxButton("一", &box); };
        const QPointer<QAbstractButton> first = make();
        QAbstractButton* second = make();
        QAbstractButton* third = make();
        box.setButtonList({first, second}, true);
        second->click();
        QCOMPARE(box.checkedButton(), second);
        box.setButtonList({second, third}, true);
        QVERIFY(!first && second->autoExclusive());
        third->click();
        QVERIFY(!second->isChecked() && third->isChecked());
        QCOMPARE(clicked.count(), 2);
        QCOMPARE(clicked[1][0].value<QAbstractButton*>(), third);
        box.setButtonList({third}, false);
        QCOMPARE(box.buttonList(), QList<QAbstractButton*>{third});
        QVERIFY(!third->isCheckable() && !third->autoExclusive());
    }

    void titleBarShowsItsMenu()
    {
        ToolkitTitlebar bar;
        auto* button = bar.findChild<QToolButton*>(QString(), Qt::FindDirectChildrenOnly);
        QVERIFY(shown(bar) && bar.autoFillBackground() && !button->isVisible());
        bar.setMenu(new QMenu(&bar));
        QVERIFY(button->isVisible() && button->popupMode() == QToolButton::InstantPopup);
        bar.setMenuVisible(false);
        QVERIFY(!button->isVisible());
        bar.setBackgroundTransparent(true);
        QVERIFY(!bar.autoFillBackground());
        QCOMPARE(button->toolTip(), QString("菜单"));
        QTest::mouseClick(bar.findChild<QToolButton*>("titlebarCloseButton"), Qt::LeftButton);
        QVERIFY(!bar.isVisible());
    }

    void dialogChoosesItsFocus()
    {
        ToolkitDialog dialog;
        QVERIFY(shown(dialog));
        QCOMPARE(dialog.focusWidget()->objectName(), "titlebarCloseButton");
        dialog.hide();
        const std::tuple<const char*, bool, ToolkitDialog::ButtonType, const char*> kinds[] = {
            {"a&b", false, ToolkitDialog::ButtonNormal, "ToolkitPushButton"},
            {"c", false, ToolkitDialog::ButtonRecommend, "ToolkitSuggestButton"},
            {"d", true, ToolkitDialog::ButtonWarning, "ToolkitWarningButton"}};
        int index = 0;
        for (const auto& [text, isDefault, type, name] : kinds) {
            QCOMPARE(dialog.addButton(text, isDefault, type), index);
            auto* button = qobject_cast<QPushButton*>(dialog.buttons()[index++]);
            QCOMPARE(button->metaObject()->className(), name);
            QCOMPARE(button->accessibleName(), text);
            QCOMPARE(button->text(), QString(text).replace("&", "&&"));
            QVERIFY(button->isDefault() == isDefault && !button->autoDefault());
        }
        dialog.setMessage("message");
        QCOMPARE(dialog.accessibleName() + dialog.accessibleDescription(), "message");
        dialog.setTitle("title");
        QCOMPARE(dialog.accessibleName() + dialog.accessibleDescription(), "titlemessage");
        for (QWidget* former : {dialog.focusWidget(), static_cast<QWidget*>(dialog.buttons()[2])})
            former->clearFocus();
        dialog.setWindowFlags(Qt::Widget);
        QVERIFY(shown(dialog));
        QCOMPARE(dialog.focusWidget(), dialog.buttons()[2]);
        QVERIFY(dialog.windowFlags().testFlag(Qt::FramelessWindowHint) && dialog.isWindow());
        const QSignalSpy chosen(&dialog, &ToolkitDialog::buttonClicked);
        QTest::keyClick(&dialog, Qt::Key_Enter);
        QCOMPARE(chosen.count() + dialog.result(), 1 + 2);
        QVERIFY(shown(dialog));
        QTest::keyClick(&dialog, Qt::Key_Escape);
        QVERIFY(!dialog.isVisible());
    }

    void frameKnowsItsKeys()
    {
        ToolkitBlurFrame frame;
        auto* edit = new QLineEdit(&frame);
        auto* button = new ToolkitPushButton("一", &frame);
        auto* panel = new ToolkitBlurFrame(&frame);
        QCOMPARE(frame.radius(), 12);
        QCOMPARE(frame.maskAlpha(), 230);
        QCOMPARE(frame.maskColor(), QColor(0xfa, 0xfa, 0xfb));
        for (const auto& [alpha, kept] : {std::pair{-1, 0}, {300, 255}}) {
            frame.setMaskAlpha(alpha);
            QCOMPARE(frame.maskAlpha(), kept);
        }
        const QSignalSpy clicked(button, &QAbstractButton::clicked);
        QVERIFY(shown(frame));
        edit->setFocus();
        QTest::keyClick(edit, Qt::Key_Return);
        QCOMPARE(clicked.count(), 0);
        for (const Qt::Key key : {Qt::Key_Return, Qt::Key_Enter, Qt::Key_A}) {
            button->setFocus();
            QTest::keyClick(&frame, key);
        }
        QCOMPARE(clicked.count(), 2);
        QTest::keyClick(panel, Qt::Key_Escape);
        QVERIFY(!frame.isVisible() && panel->isVisibleTo(&frame));
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestToolkitWidgets test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_toolkitwidgets.moc"

// SPDX-License-Identifier: Apache-2.0
#include "fixture.h"
#include "themehelper.h"
#include "toolkitapplication.h"
#include "toolkitblurframe.h"
#include "toolkitbuttonbox.h"
#include "toolkitcombobox.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"
#include "toolkittoolbutton.h"
#include "toolkitwarningbutton.h"
#include "widgets.h"

#include <QtWidgets>

namespace
{

/// What pointing at the widget shows.
QString toolTip(QWidget& widget)
{
    QHelpEvent event(QEvent::ToolTip, QPoint(1, 1), QPoint(1, 1));
    return QApplication::sendEvent(&widget, &event) && event.isAccepted() ? QToolTip::text() : QString();
}

class PaintCounter : public QObject
{
public:
    explicit PaintCounter(QObject* watched) : QObject(watched) { watched->installEventFilter(this); }
    bool eventFilter(QObject*, QEvent* event) override
    {
        count += event->type() == QEvent::Paint ? 1 : 0;
        return false;
    }
    int count = 0;
};

} // namespace

class TestToolkitWidgets : public QObject
{
    Q_OBJECT

private slots:
    void buttonsFitTheirTexts()
    {
        const std::tuple<const char*, int, int> rows[] = {{"", 14, 80}, {"终端", 14, 80}, {"终端别名终端", 14, 116}};
        for (const auto& [text, pixels, width] : rows) {
            ToolkitSuggestButton button(text);
            button.setFont(font(pixels));
            QCOMPARE(button.sizeHint(), QSize(width, 36));
        }
        ToolkitPushButton button("█");
        ToolkitButtonBoxButton segment("█");
        for (QAbstractButton* one : {static_cast<QAbstractButton*>(&button), static_cast<QAbstractButton*>(&segment)})
            one->setFont(font(100));
        const QSize glyph = button.fontMetrics().size(0, "█");
        QCOMPARE(button.sizeHint(), glyph + QSize(32, 12));
        QCOMPARE(segment.sizeHint(), glyph + QSize(32, 14));
        QCOMPARE(button.minimumSizeHint(), QSize(0, glyph.height() + 4));
        ToolkitToolButton tool;
        tool.setText("█");
        tool.setFont(font(20));
        tool.resize(200, 30);
        for (const auto& [alignment, x] :
             {std::pair{Qt::AlignHCenter, 100}, {Qt::AlignLeft, 8}, {Qt::AlignRight, 191}}) {
            tool.setTextAlignment(alignment | Qt::AlignTop);
            for (const int column : {8, 100, 191})
                QCOMPARE(tool.grab().toImage().pixelColor(column, 15).lightness() < 128, column == x);
        }
    }

    void buttonsHaveTheirColours_data() { fixture::addRows("buttoncolours.json"); }
    void buttonsHaveTheirColours()
    {
        QFETCH(QJsonObject, row);
        const std::unique_ptr<QPushButton> buttons[] = {
            std::make_unique<ToolkitPushButton>("█"), std::make_unique<ToolkitSuggestButton>("█"),
            std::make_unique<ToolkitWarningButton>("█"), std::make_unique<ToolkitSuggestButton>()};
        QJsonArray got;
        for (const auto& button : buttons) {
            button->setPalette(ThemeHelper::palette(ThemeHelper::LightType));
            button->setFont(font(100));
            button->resize(button->sizeHint());
            button->setEnabled(!row["disabled"].toBool());
            button->setDown(row["down"].toBool());
            button->setAttribute(Qt::WA_UnderMouse, row["hovered"].toBool());
            const QImage image = button->grab().toImage();
            got.append(image.pixelColor(button->rect().center()).name() + image.pixelColor(8, 18).name());
        }
        fixture::compare(got, row["colours"]);
    }

    void titleBarDragsItsWindow()
    {
        QWidget window;
        auto* bar = new ToolkitTitlebar(&window);
        QVERIFY(shown(window));
        window.move(100, 100);
        const QSignalSpy dragged(bar, &ToolkitTitlebar::windowDragged);
        // Sends an event of the mouse, and returns whether the bar takes it.
        const auto mouse = [bar](QEvent::Type type, const QPoint& place, Qt::MouseButton button = Qt::NoButton) {
            QMouseEvent event(type, bar->mapFromGlobal(place), place, button, Qt::LeftButton, Qt::NoModifier);
            QApplication::sendEvent(bar, &event);
            return event.isAccepted();
        };
        QVERIFY(!mouse(QEvent::MouseMove, {200, 200}));
        QVERIFY(!mouse(QEvent::MouseButtonPress, {110, 110}, Qt::RightButton));
        mouse(QEvent::MouseMove, {200, 200});
        for (const int distance : {QApplication::startDragDistance() - 1, QApplication::startDragDistance()}) {
            const int before = dragged.count();
            window.move(100, 100);
            QVERIFY(mouse(QEvent::MouseButtonPress, {110, 110}, Qt::LeftButton));
            mouse(QEvent::MouseMove, QPoint(110, 110 + distance));
            const bool drags = distance == QApplication::startDragDistance();
            QCOMPARE(window.pos(), QPoint(100, drags ? 100 + distance : 100));
            QCOMPARE(dragged.count() - before, drags ? 1 : 0);
        }
        mouse(QEvent::MouseMove, {160, 150});
        QVERIFY(!mouse(QEvent::MouseButtonRelease, {160, 150}, Qt::LeftButton));
        mouse(QEvent::MouseMove, {200, 200});
        QCOMPARE(window.pos(), QPoint(150, 140));
        QCOMPARE(dragged.count(), 1);
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
        auto* bubble = window.findChildren<QLabel*>("alertBubble").last();
        QCOMPARE(edit.alertMessage(), row["message"].toString());
        QCOMPARE(bubble->text(), row["shown"].toString(row["message"].toString()));
        const QRect field = edit.geometry();
        const QRect got = bubble->geometry();
        QVERIFY(bubble->isVisible() && window.rect().contains(got) && window.children().last() == bubble);
        QCOMPARE(bubble->grab().toImage().pixelColor(got.width() / 2, 2), QColor(0xb3, 0x26, 0x1e));
        QCOMPARE(fixture::text(QJsonArray{got.left(), got.width()}), fixture::text(row["bubble"]));
        const bool inside = field.contains(got) && got.center().y() == field.center().y();
        QCOMPARE(inside                            ? "inside"
                 : got.top() == field.bottom() + 5 ? "below"
                 : got.bottom() == field.top() - 5 ? "above"
                                                   : "",
                 row["place"].toString());
        edit.setText("a text so long that no bubble has room behind it");
        QCOMPARE(field.contains(bubble->geometry()), false);
        edit.move(field.x() + 3, field.y());
        QCOMPARE(bubble->x(), field.x() + 3);
        bubble->move(0, 0);
        QApplication::postEvent(&window, new QEvent(QEvent::LayoutRequest));
        QTRY_COMPARE(bubble->x(), field.x() + 3);
        edit.hideAlertMessage();
        QVERIFY(!bubble->isVisible() && edit.alertMessage().isEmpty() && !timer->isActive());
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
        // It does so once.
        label.hide();
        label.shrinkFontToWidth();
        label.show();
        label.hide();
        label.setFont(font(14));
        label.show();
        QCOMPARE(label.font().pixelSize(), 14);
        const std::tuple<int, bool, const char*> rows[] = {
            {112, false, ""}, {111, false, "终端别名终端别名"}, {20, true, ""}, {20, false, "终端别名终端别名"}};
        for (const auto& [width, wraps, tip] : rows) {
            label.setFont(font(14));
            label.resize(width, 18);
            label.setWordWrap(wraps);
            QCOMPARE(toolTip(label), QString(tip));
        }
        label.setToolTip("own");
        QCOMPARE(toolTip(label), "own");
        QCOMPARE(ToolkitLabel::plainToolTip("a < b"), "a < b");
        QCOMPARE(ToolkitLabel::plainToolTip("<b>a</b>"), "&lt;b&gt;a&lt;/b&gt;");
    }

    void comboBoxTellsWhatItCuts()
    {
        ToolkitComboBox box;
        box.setFont(font(14));
        box.addItem("<b>终</b>");
        box.addItem("终端别名终端别名");
        box.resize(20, 36);
        QCOMPARE(toolTip(box), "&lt;b&gt;终&lt;/b&gt;");
        box.setCurrentIndex(1);
        for (const auto& [width, tip] : {std::pair{153, "终端别名终端别名"}, {154, ""}}) {
            box.resize(width, 36);
            QCOMPARE(toolTip(box), QString(tip));
        }
        box.setPalette(ThemeHelper::palette(ThemeHelper::DarkType));
        box.showPopup();
        for (const auto group : {QPalette::Active, QPalette::Inactive, QPalette::Disabled}) {
            for (int role = 0; role < QPalette::NColorRoles; ++role)
                QCOMPARE(box.view()->palette().color(group, QPalette::ColorRole(role)),
                         box.palette().color(group, QPalette::ColorRole(role)));
        }
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

    void frameKnowsItsKeys()
    {
        ToolkitBlurFrame frame;
        auto* edit = new QLineEdit(&frame);
        auto* button = new ToolkitPushButton("一", &frame);
        auto* panel = new ToolkitBlurFrame(&frame);
        for (const auto& [alpha, kept] : {std::pair{-1, 0}, {300, 255}}) {
            frame.setMaskAlpha(alpha);
            QCOMPARE(frame.maskAlpha(), kept);
        }
        for (const auto& [grey, type] : {std::pair{127, ThemeHelper::DarkType}, {128, ThemeHelper::LightType}}) {
            frame.setMaskColor(QColor(grey, grey, grey));
            QCOMPARE(frame.maskColor().red(), grey);
            QCOMPARE(frame.palette(), ThemeHelper::palette(type));
        }
        QCOMPARE(QAccessible::queryAccessibleInterface(&frame)->role(), QAccessible::Window);
        QVERIFY(QAccessible::queryAccessibleInterface(panel)->role() != QAccessible::Window);
        const QSignalSpy clicked(button, &QAbstractButton::clicked);
        QVERIFY(shown(frame));
        const std::tuple<QWidget*, Qt::Key, int, bool> rows[] = {{edit, Qt::Key_Return, 0, false},
                                                                 {button, Qt::Key_Return, 1, true},
                                                                 {button, Qt::Key_Enter, 2, true},
                                                                 {button, Qt::Key_A, 2, false},
                                                                 {panel, Qt::Key_Escape, 2, true}};
        for (const auto& [focused, key, clicks, taken] : rows) {
            focused == panel ? frame.setFocus() : focused->setFocus();
            QKeyEvent event(QEvent::KeyPress, key, Qt::NoModifier);
            QApplication::sendEvent(focused == panel ? panel : &frame, &event);
            QCOMPARE(event.isAccepted(), taken);
            QCOMPARE(clicked.count(), clicks);
        }
        QVERIFY(!frame.isVisible() && panel->isVisibleTo(&frame));
    }

    void changesAreDrawn()
    {
        ToolkitBlurFrame frame;
        ToolkitToolButton tool(&frame);
        ToolkitPasswordEdit edit(&frame);
        ToolkitSpinner spinner(&frame);
        QVERIFY(shown(frame));
        const QSignalSpy alerts(&edit, &ToolkitLineEdit::alertChanged);
        const std::pair<QWidget*, std::function<void()>> changes[] = {
            {&frame, [&] { frame.setMaskColor(Qt::white); }},
            {&frame, [&] { frame.setMaskAlpha(3); }},
            {&frame, [&] { frame.setRadius(3); }},
            {&tool, [&] { tool.setIconTinted(true); }},
            {&tool, [&] { tool.setTextAlignment(Qt::AlignLeft); }},
            {&edit, [&] { edit.setAlert(true); }},
            {&spinner, [&] { spinner.start(); }}};
        for (const auto& [widget, change] : changes) {
            QTest::qWait(0);
            const PaintCounter counter(widget);
            change();
            QTRY_VERIFY2(counter.count > 0, widget->metaObject()->className());
        }
        edit.setAlert(true);
        edit.showAlertMessage("wrong");
        QCOMPARE(alerts.count(), 1);
        QVERIFY(edit.isAlert());
        auto* doomed = new ToolkitLineEdit(&frame);
        doomed->showAlertMessage("wrong");
        const QPointer<QLabel> bubble = frame.findChildren<QLabel*>("alertBubble").last();
        delete doomed;
        QVERIFY(!bubble);
        // A window that only the desktop hides keeps the bubble.
        for (const bool spontaneous : {true, false}) {
            QHideEvent hidden;
            if (spontaneous)
                QSpontaneKeyEvent::setSpontaneous(&hidden);
            QVERIFY(qApp->notify(&edit, &hidden));
            QCOMPARE(edit.alertMessage(), spontaneous ? "wrong" : "");
        }
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestToolkitWidgets test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_toolkitwidgets.moc"

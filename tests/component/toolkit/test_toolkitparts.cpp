// SPDX-License-Identifier: Apache-2.0
#include "description.h"
#include "toolkitbuttonbox.h"
#include "toolkitcombobox.h"
#include "toolkitdialog.h"
#include "toolkitframe.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"
#include "toolkittoolbutton.h"
#include "toolkitwarningbutton.h"
#include "widgets.h"

#include <functional>

namespace
{

/// What pointing at the widget shows.
QString toolTip(QWidget& widget)
{
    QHelpEvent event(QEvent::ToolTip, QPoint(1, 1), QPoint(1, 1));
    return QApplication::sendEvent(&widget, &event) && event.isAccepted() ? QToolTip::text() : QString();
}

/// Every colour of the palette, by its group and role.
QJsonObject colours(const QPalette& palette)
{
    static const auto kRoles = QMetaEnum::fromType<QPalette::ColorRole>();
    static const auto kGroups = QMetaEnum::fromType<QPalette::ColorGroup>();
    QJsonObject colours;
    for (const auto group : {QPalette::Active, QPalette::Inactive, QPalette::Disabled}) {
        for (int role = 0; role < QPalette::NColorRoles; ++role)
            colours[QString(kGroups.valueToKey(group)) + ' ' + kRoles.valueToKey(role)] =
                palette.color(group, QPalette::ColorRole(role)).name();
    }
    return colours;
}

} // namespace

/// What the widgets of the toolkit are made of and draw, each in the states that the rows of the tables say.
class TestToolkitParts : public QObject
{
    Q_OBJECT

    static QIcon icon()
    {
        QPixmap pixmap(16, 16);
        pixmap.fill(Qt::transparent);
        QPainter(&pixmap).fillRect(4, 2, 8, 12, Qt::darkCyan);
        return pixmap;
    }

    static QWidget* segments(QWidget* parent)
    {
        auto* box = new ToolkitButtonBox(parent);
        for (const char* name : {"first", "second"}) {
            box->addButton(new ToolkitButtonBoxButton("", box));
            box->buttonList().constLast()->setObjectName(name);
        }
        box->buttonList().constFirst()->setChecked(true);
        return box;
    }

    static QWidget* titlebar(QWidget* parent)
    {
        auto* bar = new ToolkitTitlebar(parent);
        bar->setIcon(icon());
        bar->setMenu(new QMenu(bar));
        return bar;
    }

    static QWidget* box(QWidget*)
    {
        auto* dialog = new ToolkitDialog;
        dialog->setIcon(icon());
        dialog->setTitle("标题");
        dialog->setMessage("文字");
        dialog->addContent(new ToolkitLineEdit, Qt::AlignRight);
        dialog->addButton("A&B", true);
        dialog->addButton("建议", false, ToolkitDialog::ButtonRecommend);
        dialog->addButton("警告", false, ToolkitDialog::ButtonWarning);
        dialog->setSurface(ThemeHelper::DarkType);
        return dialog;
    }

    static inline const std::map<QString, std::function<QWidget*(QWidget*)>> kMakers{
        {"push button", [](QWidget* parent) { return new ToolkitPushButton(parent); }},
        {"suggest button", [](QWidget* parent) { return new ToolkitSuggestButton("", parent); }},
        {"warning button", [](QWidget* parent) { return new ToolkitWarningButton("", parent); }},
        {"tool button", [](QWidget* parent) { return new ToolkitToolButton(parent); }},
        {"segments", segments},
        {"segment", [](QWidget* parent) { return new ToolkitButtonBoxButton("", parent); }},
        {"label", [](QWidget* parent) { return new ToolkitLabel(parent); }},
        {"combo box", [](QWidget* parent) { return new ToolkitComboBox(parent); }},
        {"line edit", [](QWidget* parent) { return new ToolkitLineEdit(parent); }},
        {"password edit", [](QWidget* parent) { return new ToolkitPasswordEdit(parent); }},
        {"title bar", titlebar},
        {"spinner", [](QWidget* parent) { return new ToolkitSpinner(parent); }},
        {"surface", [](QWidget* parent) { return new ToolkitBlurFrame(parent); }},
        {"dialog", [](QWidget*) { return new ToolkitDialog; }},
        {"message box", box},
        {"line", [](QWidget* parent) { return new ToolkitFrame(parent); }},
    };

    template <typename Widget>
    static Widget* as(QWidget* widget)
    {
        return qobject_cast<Widget*>(widget);
    }

    static QSize textSize(const QWidget* widget) { return widget->fontMetrics().size(0, "█"); }

    static void loosen(QWidget* box)
    {
        as<ToolkitButtonBox>(box)->setButtonList(box->findChildren<QAbstractButton*>("second"), false);
    }

    /// The states that are no properties.
    static inline const std::map<QString, std::function<void(QWidget*)>> kWords{
        {"", [](QWidget*) {}},
        {"dark", [](QWidget* one) { one->window()->setPalette(ThemeHelper::palette(ThemeHelper::DarkType)); }},
        {"hovered", [](QWidget* one) { one->setAttribute(Qt::WA_UnderMouse); }},
        {"large", [](QWidget* one) { one->resize(180, 40); }},
        {"fitted", [](QWidget* one) { one->setFixedSize(one->sizeHint()); }},
        {"padded", [](QWidget* one) { one->setFixedSize(one->sizeHint() - textSize(one)); }},
        {"least",
         [](QWidget* one) {
             one->setFixedSize(QSize(9, 0) + one->minimumSizeHint() - QSize(0, textSize(one).height()));
         }},
        {"100px", [](QWidget* one) { one->setFont(font(100)); }},
        {"14px", [](QWidget* one) { one->setFont(font(14)); }},
        {"shown", [](QWidget* one) { QVERIFY(shown(*one->window())); }},
        {"gone", [](QWidget* one) { one->window()->hide(); }},
        {"icon", [](QWidget* one) { as<QAbstractButton>(one)->setIcon(icon()); }},
        {"tinted", [](QWidget* one) { as<ToolkitToolButton>(one)->setIconTinted(true); }},
        {"left", [](QWidget* one) { as<ToolkitToolButton>(one)->setTextAlignment(Qt::AlignLeft | Qt::AlignTop); }},
        {"right", [](QWidget* one) { as<ToolkitToolButton>(one)->setTextAlignment(Qt::AlignRight); }},
        {"loosened", loosen},
        {"item", [](QWidget* one) { as<QComboBox>(one)->addItem("终端别名终端别名"); }},
        {"marked-up item", [](QWidget* one) { as<QComboBox>(one)->addItem("<b>终</b>"); }},
        {"shrunk", [](QWidget* one) { as<ToolkitLabel>(one)->shrinkFontToWidth(); }},
        {"alert", [](QWidget* one) { as<ToolkitLineEdit>(one)->setAlert(true); }},
        {"filled", [](QWidget* one) { as<ToolkitPasswordEdit>(one)->setClearIcon(icon()); }},
        {"emptied", [](QWidget* one) { as<ToolkitPasswordEdit>(one)->clear(); }},
        {"eyeless", [](QWidget* one) { as<ToolkitPasswordEdit>(one)->setEchoButtonVisible(false); }},
        {"playing", [](QWidget* one) { as<ToolkitSpinner>(one)->start(); }},
        {"stopped", [](QWidget* one) { as<ToolkitSpinner>(one)->stop(); }},
        {"turned", [](QWidget* one) { QMetaObject::invokeMethod(one->findChild<QTimer*>(), "timeout"); }},
        {"menuless", [](QWidget* one) { as<ToolkitTitlebar>(one)->setMenuVisible(false); }},
        {"transparent", [](QWidget* one) { as<ToolkitTitlebar>(one)->setBackgroundTransparent(true); }},
        {"clear", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskAlpha(99); }},
        {"sharp", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setRadius(4); }},
        {"clearest", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskAlpha(-1); }},
        {"opaque", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskAlpha(300); }},
        {"grey", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskColor(QColor(127, 127, 127)); }},
        {"lighter grey", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskColor(QColor(128, 128, 128)); }},
        {"white", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskColor(Qt::white); }},
        {"night", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskColor(Qt::darkBlue); }},
    };

    /// Puts the widget into a state: "child:word" one of its children, "name=value" by a property, "name()" by a slot,
    /// "Ctrl+R" by keys, and else as the table says. One that it cannot have fails the test.
    static void apply(QWidget* widget, const QString& word)
    {
        const int colon = word.indexOf(':');
        const int equals = word.indexOf('=');
        if (colon > 0)
            apply(widget->findChild<QWidget*>(word.left(colon)), word.mid(colon + 1));
        else if (equals > 0)
            QVERIFY2(widget->setProperty(qPrintable(word.left(equals)), word.mid(equals + 1)), qPrintable(word));
        else if (word.endsWith("()"))
            QVERIFY2(QMetaObject::invokeMethod(widget, qPrintable(word.chopped(2))), qPrintable(word));
        else if (word.startsWith("Ctrl+"))
            QTest::keySequence(widget, QKeySequence(word));
        else
            kWords.at(word)(widget);
    }

    /// The widget in the state that the words say, in a light window or a dark one.
    static QImage picture(const QString& kind, const QSize& size, const QStringList& words)
    {
        QWidget window;
        window.setPalette(ThemeHelper::palette(ThemeHelper::LightType));
        window.resize(size);
        const std::unique_ptr<QWidget> widget(kMakers.at(kind)(&window));
        widget->resize(size);
        if (!shown(window))
            qFatal("no active window");
        // As after a press of Tab.
        window.setAttribute(Qt::WA_KeyboardFocusChange);
        window.setFocus();
        for (const QString& word : words)
            apply(widget.get(), word);
        QImage image(size, QImage::Format_ARGB32_Premultiplied);
        image.fill(window.palette().color(QPalette::Window));
        QPainter painter(&image);
        widget->render(&painter, QPoint(), QRegion(), QWidget::DrawChildren);
        return image;
    }

    /// Whether no colour of a pixel differs visibly.
    static bool areAlike(const QImage& a, const QImage& b)
    {
        const auto near = [](uchar one, uchar other) { return std::abs(one - other) <= 4; };
        return a.size() == b.size() && std::equal(a.constBits(), a.constBits() + a.sizeInBytes(), b.constBits(), near);
    }

private slots:
    // They hold no text, so that no font matters. A row's picture shows its states from left to right.
    void states_data() { fixture::addRows("pictures.json"); }
    void states()
    {
        QFETCH(QJsonObject, row);
        const QString kind = QTest::currentDataTag();
        const QSize size(row["width"].toInt(), row["height"].toInt());
        const QJsonArray states = row["states"].toArray();
        QImage strip(size.width() * states.size(), size.height(), QImage::Format_RGB32);
        QPainter painter(&strip);
        for (int i = 0; i < states.size(); ++i)
            painter.drawImage(i * size.width(), 0, picture(kind, size, states[i].toString().split(' ')));
        painter.end();
        const QString name = "pictures/" + QString(kind).replace(' ', '-') + ".png";
        const QImage expected = QImage(ZENT_TEST_DATA "/" + name).convertToFormat(strip.format());
        const QString got = QDir::tempPath() + "/" + QFileInfo(name).fileName();
        QVERIFY2(areAlike(strip, expected) || !strip.save(got),
                 qPrintable("not as in tests/data/" + name + ", but as in " + got));
    }

    void parts_data() { fixture::addRows("toolkitparts.json"); }
    void parts()
    {
        QFETCH(QJsonObject, row);
        QWidget window;
        window.setPalette(ThemeHelper::palette(ThemeHelper::LightType));
        const std::unique_ptr<QWidget> widget(kMakers.at(row["kind"].toString())(&window));
        QGuiApplication::clipboard()->clear();
        for (const QJsonValue& word : row["words"].toArray())
            apply(widget.get(), word.toString());
        if (row.contains("widgets"))
            description::compare(widget.get(), row["widgets"]);
        // Every change has been drawn.
        if (window.isVisible())
            QTRY_COMPARE(window.screen()->grabWindow(window.winId()).toImage(), window.grab().toImage());
        QCOMPARE(QGuiApplication::clipboard()->text(), row["copied"].toString());
        QCOMPARE(toolTip(*widget), row["tip"].toString(widget->toolTip()));
    }

    // The colours at the left edge, in the middle and at the right edge; the text is a block.
    void inks_data() { fixture::addRows("inks.json"); }
    void inks()
    {
        QFETCH(QJsonObject, row);
        const QStringList words = row["words"].toVariant().toStringList();
        const QImage image = picture(row["kind"].toString(), QSize(200, 36), QStringList{"14px", "text=█"} + words);
        QJsonArray got;
        for (const int column : {8, 100, 191})
            got.append(image.pixelColor(column, 18).name());
        fixture::compare(got, row["colours"]);
    }

    void palettes()
    {
        const QJsonObject expected = fixture::read("palettes.json");
        for (const auto type : {ThemeHelper::UnknownType, ThemeHelper::LightType})
            fixture::compare(colours(ThemeHelper::palette(type)), expected["light"]);
        // The list of a combo box is a window of its own.
        QWidget window;
        window.setPalette(ThemeHelper::palette(ThemeHelper::DarkType));
        ToolkitComboBox box(&window);
        box.showPopup();
        for (const QWidget* one : {&window, static_cast<QWidget*>(box.view())})
            fixture::compare(colours(one->palette()), expected["dark"]);
    }
};

QTEST_MAIN(TestToolkitParts)
#include "test_toolkitparts.moc"

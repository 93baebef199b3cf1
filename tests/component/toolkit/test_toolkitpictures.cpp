// SPDX-License-Identifier: Apache-2.0
#include "description.h"
#include "toolkitbuttonbox.h"
#include "toolkitcombobox.h"
#include "toolkitdialog.h"
#include "toolkitframe.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"
#include "toolkittoolbutton.h"
#include "toolkitwarningbutton.h"

#include <functional>

/// What the widgets draw in their states, compared with pictures that were looked at. They hold no text, so that no
/// font matters. A row's picture shows its states from left to right.
class TestToolkitPictures : public QObject
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
        for (int number = 0; number < 2; ++number)
            box->addButton(new ToolkitButtonBoxButton("", box));
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

    static QWidget* make(const QString& kind, QWidget* parent)
    {
        static const std::map<QString, std::function<QWidget*(QWidget*)>> kMakers{
            {"push button", [](QWidget* parent) { return new ToolkitPushButton(parent); }},
            {"suggest button", [](QWidget* parent) { return new ToolkitSuggestButton("", parent); }},
            {"warning button", [](QWidget* parent) { return new ToolkitWarningButton("", parent); }},
            {"tool button", [](QWidget* parent) { return new ToolkitToolButton(parent); }},
            {"segments", segments},
            {"segment", [](QWidget* parent) { return new ToolkitButtonBoxButton("", parent); }},
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
        return kMakers.at(kind)(parent);
    }

    template <typename Widget>
    static Widget* as(QWidget* widget)
    {
        return qobject_cast<Widget*>(widget);
    }

    /// Puts the widget into a state; one that it cannot have fails the test.
    static void apply(QWidget* widget, const QString& word)
    {
        static const std::map<QString, std::function<void(QWidget*)>> kWords{
            {"", [](QWidget*) {}},
            {"dark", [](QWidget*) {}},
            {"hovered", [](QWidget* one) { one->setAttribute(Qt::WA_UnderMouse); }},
            {"disabled", [](QWidget* one) { one->setEnabled(false); }},
            {"focused", [](QWidget* one) { one->setFocus(); }},
            {"large", [](QWidget* one) { one->resize(180, 40); }},
            {"shown", [](QWidget* one) { one->window()->show(); }},
            {"gone", [](QWidget* one) { one->window()->hide(); }},
            {"upright", [](QWidget* one) { as<QFrame>(one)->setFrameShape(QFrame::VLine); }},
            {"level", [](QWidget* one) { as<QFrame>(one)->setFrameShape(QFrame::HLine); }},
            {"down", [](QWidget* one) { as<QAbstractButton>(one)->setDown(true); }},
            {"checked", [](QWidget* one) { as<QAbstractButton>(one)->setChecked(true); }},
            {"icon", [](QWidget* one) { as<QAbstractButton>(one)->setIcon(icon()); }},
            {"tinted", [](QWidget* one) { as<ToolkitToolButton>(one)->setIconTinted(true); }},
            {"alert", [](QWidget* one) { as<ToolkitLineEdit>(one)->setAlert(true); }},
            {"typed", [](QWidget* one) { as<ToolkitLineEdit>(one)->setText("secret"); }},
            {"filled", [](QWidget* one) { as<ToolkitPasswordEdit>(one)->setClearIcon(icon()); }},
            {"emptied", [](QWidget* one) { as<ToolkitPasswordEdit>(one)->clear(); }},
            {"eyeless", [](QWidget* one) { as<ToolkitPasswordEdit>(one)->setEchoButtonVisible(false); }},
            {"Ctrl+R", [](QWidget* one) { QTest::keyClick(one, Qt::Key_R, Qt::ControlModifier); }},
            {"sought", [](QWidget* one) { one->findChild<QAbstractButton*>("echoButton")->setChecked(true); }},
            {"playing", [](QWidget* one) { as<ToolkitSpinner>(one)->start(); }},
            {"stopped", [](QWidget* one) { as<ToolkitSpinner>(one)->stop(); }},
            {"turned", [](QWidget* one) { QMetaObject::invokeMethod(one->findChild<QTimer*>(), "timeout"); }},
            {"menuless", [](QWidget* one) { as<ToolkitTitlebar>(one)->setMenuVisible(false); }},
            {"transparent", [](QWidget* one) { as<ToolkitTitlebar>(one)->setBackgroundTransparent(true); }},
            {"closed", [](QWidget* one) { one->findChild<QAbstractButton*>("titlebarCloseButton")->click(); }},
            {"clear", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskAlpha(99); }},
            {"sharp", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setRadius(4); }},
            {"night", [](QWidget* one) { as<ToolkitBlurFrame>(one)->setMaskColor(Qt::darkBlue); }},
        };
        kWords.at(word)(widget);
    }

    /// The widget in the state that the words say, in a light window or a dark one.
    static QImage picture(const QString& kind, const QSize& size, const QStringList& words)
    {
        QWidget window;
        window.setPalette(
            ThemeHelper::palette(words.contains("dark") ? ThemeHelper::DarkType : ThemeHelper::LightType));
        window.resize(size);
        const std::unique_ptr<QWidget> widget(make(kind, &window));
        widget->resize(size);
        window.show();
        if (!QTest::qWaitForWindowActive(&window))
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

    // What the toolkit's widgets are made of, before and after something is done to them.
    void parts_data() { fixture::addRows("toolkitparts.json"); }
    void parts()
    {
        QFETCH(QJsonObject, row);
        QWidget window;
        window.setPalette(ThemeHelper::palette(ThemeHelper::LightType));
        const std::unique_ptr<QWidget> widget(make(row["kind"].toString(), &window));
        for (const QJsonValue& word : row["words"].toArray())
            apply(widget.get(), word.toString());
        description::compare(widget.get(), row["widgets"]);
    }

    void palettes()
    {
        const QJsonObject expected = fixture::read("palettes.json");
        const auto roles = QMetaEnum::fromType<QPalette::ColorRole>();
        const auto groups = QMetaEnum::fromType<QPalette::ColorGroup>();
        for (const auto type : {ThemeHelper::UnknownType, ThemeHelper::LightType, ThemeHelper::DarkType}) {
            QJsonObject got;
            for (const auto group : {QPalette::Active, QPalette::Inactive, QPalette::Disabled}) {
                for (int role = 0; role < QPalette::NColorRoles; ++role)
                    got[QString(groups.valueToKey(group)) + ' ' + roles.valueToKey(role)] =
                        ThemeHelper::palette(type).color(group, QPalette::ColorRole(role)).name();
            }
            fixture::compare(got, expected[type == ThemeHelper::DarkType ? "dark" : "light"]);
        }
    }
};

QTEST_MAIN(TestToolkitPictures)
#include "test_toolkitpictures.moc"

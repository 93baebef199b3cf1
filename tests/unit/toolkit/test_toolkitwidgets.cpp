// Behaviour of the toolkit's widgets: segmented box, labels, title bar, palettes and the platform choice.

#include "themehelper.h"
#include "toolkitapplication.h"
#include "toolkitblurframe.h"
#include "toolkitbuttonbox.h"
#include "toolkitlabel.h"
#include "toolkittitlebar.h"

#include <QSignalSpy>
#include <QTextDocument>
#include <QToolButton>
#include <QVBoxLayout>
#include <QtTest>

class TestToolkitWidgets : public QObject
{
    Q_OBJECT

private slots:
    void buttonBoxIsExclusive();
    void toolTipsReadAsGiven_data();
    void toolTipsReadAsGiven();
    void palettesAreLegible_data();
    void palettesAreLegible();
    void platformChoice_data();
    void platformChoice();
};

void TestToolkitWidgets::buttonBoxIsExclusive()
{
    ToolkitButtonBox box;
    auto* first = new ToolkitButtonBoxButton(QStringLiteral("一"));
    auto* second = new ToolkitButtonBoxButton(QStringLiteral("二"));
    box.setButtonList({first, second}, true);
    first->setChecked(true);
    QSignalSpy clicks(&box, &ToolkitButtonBox::buttonClicked);
    box.show();
    QVERIFY(QTest::qWaitForWindowActive(&box));

    QTest::mouseClick(second, Qt::LeftButton);
    QVERIFY(second->isChecked() && !first->isChecked());
    second->setFocus(Qt::TabFocusReason);
    QTest::keyClick(second, Qt::Key_Left);
    QVERIFY(first->isChecked() && !second->isChecked());
    QVERIFY(first->hasFocus());
    QTest::keyClick(first, Qt::Key_Right);
    QCOMPARE(box.checkedButton(), second);
    // A second click cannot leave the box without a choice.
    QTest::mouseClick(second, Qt::LeftButton);
    QVERIFY(second->isChecked());

    QList<QAbstractButton*> clicked;
    for (const QList<QVariant>& arguments : clicks)
        clicked.append(arguments.constFirst().value<QAbstractButton*>());
    QCOMPARE(clicked, QList<QAbstractButton*>({second, first, second, second}));
}

void TestToolkitWidgets::toolTipsReadAsGiven_data()
{
    QTest::addColumn<QString>("text");
    QTest::newRow("plain") << QStringLiteral("运维管理处");
    QTest::newRow("comparison") << QStringLiteral("a < b > c");
    QTest::newRow("bold") << QStringLiteral("<b>粗体</b>");
    QTest::newRow("remote image") << QStringLiteral("<img src='http://example.invalid/x.png'> & more");
    QTest::newRow("entity") << QStringLiteral("&lt;b&gt;");
    QTest::newRow("XML") << QStringLiteral("<?xml version=\"1.0\"?>");
}

void TestToolkitWidgets::toolTipsReadAsGiven()
{
    QFETCH(QString, text);
    const QString tip = ToolkitLabel::plainToolTip(text);
    QString shown = tip;
    if (Qt::mightBeRichText(tip)) {
        QTextDocument document;
        document.setHtml(tip);
        shown = document.toPlainText();
    }
    QCOMPARE(shown, text);
}

namespace
{

qreal luminance(const QColor& color)
{
    const auto linear = [](qreal value) {
        return value <= 0.03928 ? value / 12.92 : std::pow((value + 0.055) / 1.055, 2.4);
    };
    return 0.2126 * linear(color.redF()) + 0.7152 * linear(color.greenF()) + 0.0722 * linear(color.blueF());
}

qreal contrast(const QColor& one, const QColor& other)
{
    const qreal first = luminance(one);
    const qreal second = luminance(other);
    return (qMax(first, second) + 0.05) / (qMin(first, second) + 0.05);
}

} // namespace

void TestToolkitWidgets::palettesAreLegible_data()
{
    QTest::addColumn<int>("type");
    QTest::newRow("light") << int(ThemeHelper::LightType);
    QTest::newRow("dark") << int(ThemeHelper::DarkType);
}

void TestToolkitWidgets::palettesAreLegible()
{
    QFETCH(int, type);
    const QPalette palette = ThemeHelper::palette(ThemeHelper::ColorType(type));
    const QList<QPair<QPalette::ColorRole, QPalette::ColorRole>> pairs = {
        {QPalette::WindowText, QPalette::Window},         {QPalette::Text, QPalette::Base},
        {QPalette::ButtonText, QPalette::Button},         {QPalette::ToolTipText, QPalette::ToolTipBase},
        {QPalette::PlaceholderText, QPalette::Base},      {QPalette::Link, QPalette::Window},
        {QPalette::HighlightedText, QPalette::Highlight},
    };
    for (const auto& pair : pairs) {
        for (const QPalette::ColorGroup group : {QPalette::Active, QPalette::Inactive}) {
            const qreal measured = contrast(palette.color(group, pair.first), palette.color(group, pair.second));
            QVERIFY2(measured >= 4.5, qPrintable(QStringLiteral("role %1: %2").arg(pair.first).arg(measured)));
        }
    }
}

void TestToolkitWidgets::platformChoice_data()
{
    QTest::addColumn<QByteArray>("display");
    QTest::addColumn<QByteArray>("platform");
    QTest::addColumn<QByteArray>("expected");
    QTest::newRow("X display") << QByteArray(":7") << QByteArray() << QByteArray("xcb;wayland");
    QTest::newRow("no display") << QByteArray() << QByteArray() << QByteArray();
    QTest::newRow("user's choice") << QByteArray(":7") << QByteArray("offscreen") << QByteArray("offscreen");
}

void TestToolkitWidgets::platformChoice()
{
    QFETCH(QByteArray, display);
    QFETCH(QByteArray, platform);
    QFETCH(QByteArray, expected);
    const auto set = [](const char* name, const QByteArray& value) {
        value.isEmpty() ? qunsetenv(name) : qputenv(name, value);
    };
    const QByteArray oldDisplay = qgetenv("DISPLAY");
    const QByteArray oldPlatform = qgetenv("QT_QPA_PLATFORM");
    set("DISPLAY", display);
    set("QT_QPA_PLATFORM", platform);
    QTest::ignoreMessage(QtWarningMsg,
                         QRegularExpression(QStringLiteral("AA_EnableHighDpiScaling must be set before")));
    ToolkitApplication::loadPlatformPlugin();
    const QByteArray chosen = qgetenv("QT_QPA_PLATFORM");
    set("DISPLAY", oldDisplay);
    set("QT_QPA_PLATFORM", oldPlatform);
    QCOMPARE(chosen, expected);
}

int main(int argc, char** argv)
{
    ToolkitApplication application(argc, argv);
    TestToolkitWidgets test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_toolkitwidgets.moc"

// Behaviour of the toolkit's dialog and of the widgets made for dialogs: fields, buttons and the spinner.

#include "toolkitdialog.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"
#include "toolkitwarningbutton.h"

#include <QClipboard>
#include <QCloseEvent>
#include <QSignalSpy>
#include <QTimer>
#include <QVBoxLayout>
#include <QtTest>

namespace
{

class KeptDialog : public ToolkitDialog
{
public:
    bool keep = true;
    int closeEvents = 0;

protected:
    void closeEvent(QCloseEvent* event) override
    {
        ++closeEvents;
        if (keep)
            event->ignore();
        else
            ToolkitDialog::closeEvent(event);
    }
};

QWidget* fixedContent(const QSize& size)
{
    auto* content = new QWidget;
    content->setFixedSize(size);
    return content;
}

} // namespace

class TestToolkitDialog : public QObject
{
    Q_OBJECT

private slots:
    void closingAsksTheCloseEvent_data();
    void closingAsksTheCloseEvent();
    void buttons();
    void returnPressesNoButtonByItself();
    void keepsItsFrame_data();
    void keepsItsFrame();
    void contentIsWhole_data();
    void contentIsWhole();
    void messageIsLiteralAndWhole_data();
    void messageIsLiteralAndWhole();
    void surfaceFollowsTheThemeUnlessPinned();
    void alertMovesNothing();
    void hiddenPasswordStaysInside();
    void spinnerSleepsUnseen();
};

void TestToolkitDialog::closingAsksTheCloseEvent_data()
{
    QTest::addColumn<bool>("byKey");
    QTest::newRow("Esc") << true;
    QTest::newRow("close button") << false;
}

void TestToolkitDialog::closingAsksTheCloseEvent()
{
    QFETCH(bool, byKey);
    KeptDialog dialog;
    auto* edit = new ToolkitLineEdit;
    dialog.addContent(edit);
    auto* closeButton = dialog.findChild<QAbstractButton*>(QStringLiteral("titlebarCloseButton"));
    QVERIFY(closeButton);
    QSignalSpy rejections(&dialog, &QDialog::rejected);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowActive(&dialog));
    const auto attempt = [&] {
        if (byKey)
            QTest::keyClick(edit, Qt::Key_Escape);
        else
            QTest::mouseClick(closeButton, Qt::LeftButton);
    };

    attempt();
    QCOMPARE(dialog.closeEvents, 1);
    QVERIFY(dialog.isVisible());
    QCOMPARE(rejections.count(), 0);
    dialog.keep = false;
    attempt();
    QCOMPARE(dialog.closeEvents, 2);
    QVERIFY(!dialog.isVisible());
    QCOMPARE(rejections.count(), 1);
}

void TestToolkitDialog::buttons()
{
    ToolkitDialog dialog;
    QCOMPARE(dialog.addButton(QStringLiteral("取消")), 0);
    QCOMPARE(dialog.addButton(QStringLiteral("R&D <b>"), true, ToolkitDialog::ButtonRecommend), 1);
    QCOMPARE(dialog.addButton(QStringLiteral("删除"), false, ToolkitDialog::ButtonWarning), 2);
    const QList<QAbstractButton*> buttons = dialog.buttons();
    QCOMPARE(buttons.size(), 3);
    QVERIFY(qobject_cast<ToolkitSuggestButton*>(buttons.at(1)));
    QVERIFY(qobject_cast<ToolkitWarningButton*>(buttons.at(2)));
    QVERIFY(buttons.at(1)->shortcut().isEmpty());

    QSignalSpy clicks(&dialog, &ToolkitDialog::buttonClicked);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowActive(&dialog));
    QCOMPARE(dialog.focusWidget(), buttons.at(1));
    QTest::keyClick(&dialog, Qt::Key_Return);
    QCOMPARE(dialog.result(), 1);
    QVERIFY(!dialog.isVisible());

    dialog.show();
    QTest::mouseClick(buttons.at(2), Qt::LeftButton);
    QCOMPARE(dialog.result(), 2);
    QCOMPARE(clicks.count(), 2);
    QCOMPARE(clicks.at(0), QVariantList({1, QStringLiteral("R&D <b>")}));
    QCOMPARE(clicks.at(1), QVariantList({2, QStringLiteral("删除")}));

    // A listener may delete the dialog.
    auto* doomed = new ToolkitDialog;
    doomed->addButton(QStringLiteral("确定"));
    connect(doomed, &ToolkitDialog::buttonClicked, this, [doomed] { doomed->deleteLater(); });
    doomed->show();
    doomed->buttons().constFirst()->click();
    QVERIFY(!doomed->isVisible());
}

void TestToolkitDialog::returnPressesNoButtonByItself()
{
    ToolkitDialog dialog;
    auto* edit = new ToolkitPasswordEdit;
    auto* button = new QPushButton(QStringLiteral("关闭"));
    dialog.addContent(edit);
    dialog.addContent(button);
    QSignalSpy clicks(button, &QAbstractButton::clicked);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowActive(&dialog));
    QVERIFY(edit->hasFocus());
    QTest::keyClick(edit, Qt::Key_Return);
    QCOMPARE(clicks.count(), 0);
    button->setFocus();
    QTest::keyClick(button, Qt::Key_Return);
    QCOMPARE(clicks.count(), 1);
    button->setDefault(true);
    QTest::keyClick(edit, Qt::Key_Return);
    QCOMPARE(clicks.count(), 2);
}

void TestToolkitDialog::keepsItsFrame_data()
{
    QTest::addColumn<bool>("keepsOthers");
    QTest::newRow("added") << true;
    QTest::newRow("replaced") << false;
}

void TestToolkitDialog::keepsItsFrame()
{
    QFETCH(bool, keepsOthers);
    QWidget parent;
    parent.show();
    ToolkitDialog dialog(&parent);
    const Qt::WindowFlags flags = keepsOthers ? dialog.windowFlags() : Qt::WindowFlags();
    dialog.setWindowFlags(flags | Qt::WindowStaysOnTopHint);
    dialog.show();
    QVERIFY(dialog.isWindow());
    QVERIFY(dialog.windowFlags() & Qt::FramelessWindowHint);
    QVERIFY(dialog.windowFlags() & Qt::WindowStaysOnTopHint);
}

void TestToolkitDialog::contentIsWhole_data()
{
    QTest::addColumn<QSize>("size");
    QTest::addColumn<QSize>("content");
    QTest::newRow("notice") << QSize(428, 450) << QSize(400, 395);
    QTest::newRow("release") << QSize(400, 200) << QSize(380, 140);
    QTest::newRow("progress") << QSize(380, 160) << QSize(360, 100);
    QTest::newRow("password") << QSize(400, 280) << QSize(380, 210);
}

void TestToolkitDialog::contentIsWhole()
{
    QFETCH(QSize, size);
    QFETCH(QSize, content);
    ToolkitDialog dialog;
    dialog.setFixedSize(size);
    QWidget* widget = fixedContent(content);
    dialog.addContent(widget);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowExposed(&dialog));
    QCOMPARE(dialog.size(), size);
    const QRect place(widget->mapTo(&dialog, QPoint(0, 0)), widget->size());
    QCOMPARE(place.size(), content);
    QVERIFY(dialog.rect().adjusted(10, 50, -10, 0).contains(place));
}

void TestToolkitDialog::messageIsLiteralAndWhole_data()
{
    QTest::addColumn<QString>("message");
    QTest::newRow("short") << QStringLiteral("管理员帐号或密码错误");
    QTest::newRow("mark-up") << QStringLiteral("<b>错误</b>");
    QTest::newRow("one long word") << QStringLiteral("https://") + QString(300, QLatin1Char('a'));
    QTest::newRow("many lines") << QString(500, QLatin1Char('\n'));
    QTest::newRow("huge") << QString(100000, QChar(0x5b57));
}

void TestToolkitDialog::messageIsLiteralAndWhole()
{
    QFETCH(QString, message);
    ToolkitDialog dialog;
    dialog.setMessage(message);
    dialog.addButton(QStringLiteral("确定"), true);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowExposed(&dialog));
    QCOMPARE(dialog.message(), message);
    auto* label = dialog.findChild<QLabel*>(QStringLiteral("messageLabel"));
    QCOMPARE(label->textFormat(), Qt::PlainText);
    QVERIFY(dialog.width() >= 300 && dialog.width() < 500);
    QVERIFY2(dialog.height() < 1200, qPrintable(QString::number(dialog.height())));
    const QRect text = label->fontMetrics().boundingRect(QRect(0, 0, label->width(), 100000),
                                                         Qt::AlignHCenter | Qt::TextWordWrap, label->text());
    QVERIFY(text.width() <= label->width() && text.height() <= label->height());
    QVERIFY(!label->geometry().intersects(dialog.buttons().constFirst()->geometry()));
    dialog.setMessage(QString());
    QVERIFY(label->isHidden());
}

void TestToolkitDialog::surfaceFollowsTheThemeUnlessPinned()
{
    ToolkitDialog dialog;
    QWidget* content = fixedContent(QSize(10, 10));
    dialog.addContent(content);
    dialog.setSurface(ThemeHelper::DarkType);
    QVERIFY(content->palette().color(QPalette::Window).lightness() < 128);
    dialog.setSurface(ThemeHelper::LightType);
    QVERIFY(content->palette().color(QPalette::Window).lightness() > 128);

    ToolkitDialog follower;
    QWidget* inner = fixedContent(QSize(10, 10));
    follower.addContent(inner);
    for (const ThemeHelper::ColorType type : {ThemeHelper::DarkType, ThemeHelper::LightType}) {
        QApplication::setPalette(ThemeHelper::palette(type));
        QTRY_COMPARE(ThemeHelper::instance()->themeType(), type);
        QCOMPARE(inner->palette().color(QPalette::Window), ThemeHelper::palette(type).color(QPalette::Window));
        QVERIFY(content->palette().color(QPalette::Window).lightness() > 128);
    }
}

void TestToolkitDialog::alertMovesNothing()
{
    ToolkitDialog dialog;
    auto* first = new ToolkitLineEdit;
    auto* second = new ToolkitPasswordEdit;
    dialog.addContent(first);
    dialog.addContent(second);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowActive(&dialog));
    const QList<QRect> before = {dialog.geometry(), first->geometry(), second->geometry()};
    QWidget* focused = dialog.focusWidget();

    for (ToolkitLineEdit* edit : {first, static_cast<ToolkitLineEdit*>(second)}) {
        edit->setAlert(true);
        edit->showAlertMessage(QStringLiteral("<b>密码错误</b>"), 0);
        auto* bubble = dialog.findChild<ToolkitLabel*>(QStringLiteral("alertBubble"));
        QVERIFY(bubble && bubble->isVisible());
        QCOMPARE(bubble->textFormat(), Qt::PlainText);
        QVERIFY(dialog.rect().contains(bubble->geometry()));
        QVERIFY(!bubble->geometry().intersects(QRect(edit->mapTo(&dialog, QPoint(0, 0)), edit->size())));
        QCoreApplication::processEvents();
        QCOMPARE(QList<QRect>({dialog.geometry(), first->geometry(), second->geometry()}), before);
        QCOMPARE(dialog.focusWidget(), focused);
        delete bubble;
        QVERIFY(edit->isAlert());
        edit->hideAlertMessage();
    }
}

void TestToolkitDialog::hiddenPasswordStaysInside()
{
    const QString secret = QStringLiteral("S3cret&");
    ToolkitDialog dialog;
    auto* edit = new ToolkitPasswordEdit;
    dialog.addContent(edit);
    dialog.show();
    QVERIFY(QTest::qWaitForWindowActive(&dialog));
    auto* echoButton = edit->findChild<QAbstractButton*>(QStringLiteral("echoButton"));
    QVERIFY(echoButton && !echoButton->accessibleName().isEmpty());
    QClipboard* clipboard = QGuiApplication::clipboard();
    clipboard->setText(QStringLiteral("before"));
    edit->setText(secret);
    edit->selectAll();
    QTest::keyClick(edit, Qt::Key_C, Qt::ControlModifier);
    QTest::keyClick(edit, Qt::Key_X, Qt::ControlModifier);
    QCOMPARE(clipboard->text(), QStringLiteral("before"));
    QCOMPARE(edit->text(), secret);
    QVERIFY(!edit->displayText().contains(secret) && !edit->dragEnabled());
    QVERIFY(edit->inputMethodHints() & Qt::ImhHiddenText);

    QTest::mouseClick(echoButton, Qt::LeftButton);
    QCOMPARE(edit->displayText(), secret);
    QVERIFY(edit->inputMethodHints() & Qt::ImhSensitiveData);
    // A dialog shown again must not show what was revealed before.
    dialog.hide();
    QVERIFY(!edit->displayText().contains(secret));
    echoButton->setChecked(true);
    edit->setEchoButtonVisible(false);
    QVERIFY(echoButton->isHidden() && !edit->displayText().contains(secret));
}

void TestToolkitDialog::spinnerSleepsUnseen()
{
    QWidget window;
    auto* layout = new QVBoxLayout(&window);
    auto* spinner = new ToolkitSpinner;
    layout->addWidget(spinner);
    auto* timer = spinner->findChild<QTimer*>();
    QVERIFY(timer);
    spinner->start();
    QVERIFY(spinner->isPlaying() && !timer->isActive());
    window.show();
    QVERIFY(timer->isActive());
    window.hide();
    QVERIFY(spinner->isPlaying() && !timer->isActive());
    window.show();
    QVERIFY(timer->isActive());
    spinner->stop();
    QVERIFY(!spinner->isPlaying() && !timer->isActive());
}

QTEST_MAIN(TestToolkitDialog)
#include "test_toolkitdialog.moc"

// Behaviour of the toolkit: the dialog, the widgets made for it, palettes and the platform choice.

#include "toolkitapplication.h"
#include "toolkitbuttonbox.h"
#include "toolkitdialog.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitspinner.h"

#include <QClipboard>
#include <QCloseEvent>
#include <QSignalSpy>
#include <QTextDocument>
#include <QTimer>
#include <QVBoxLayout>
#include <QtTest>

namespace
{

class KeptDialog : public ToolkitDialog
{
public:
    bool keep = true;

protected:
    void closeEvent(QCloseEvent* event) override { keep ? event->ignore() : ToolkitDialog::closeEvent(event); }
};

template <typename Content>
Content* addTo(ToolkitDialog& dialog, Content* content)
{
    dialog.addContent(content);
    return content;
}

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
    void closingAsksTheCloseEvent()
    {
        for (const bool byKey : {true, false}) {
            KeptDialog dialog;
            auto* edit = addTo(dialog, new ToolkitLineEdit);
            QSignalSpy rejections(&dialog, &QDialog::rejected);
            QVERIFY(shown(dialog));
            for (const bool keep : {true, false}) {
                dialog.keep = keep;
                if (byKey)
                    QTest::keyClick(edit, Qt::Key_Escape);
                else
                    QTest::mouseClick(dialog.findChild<QAbstractButton*>("titlebarCloseButton"), Qt::LeftButton);
                QCOMPARE(dialog.isVisible(), keep);
                QCOMPARE(rejections.count(), keep ? 0 : 1);
            }
        }
    }

    void buttons()
    {
        ToolkitDialog dialog;
        QCOMPARE(dialog.addButton("取消"), 0);
        QCOMPARE(dialog.addButton("R&D <b>", true, ToolkitDialog::ButtonRecommend), 1);
        QVERIFY(dialog.buttons().at(1)->shortcut().isEmpty());
        QSignalSpy clicks(&dialog, &ToolkitDialog::buttonClicked);
        QVERIFY(shown(dialog));
        QTest::keyClick(&dialog, Qt::Key_Return);
        QCOMPARE(dialog.result(), 1);
        QVERIFY(!dialog.isVisible());
        QCOMPARE(clicks.value(0), QVariantList({1, "R&D <b>"}));
        dialog.show();
        QTest::mouseClick(dialog.buttons().at(0), Qt::LeftButton);
        QCOMPARE(dialog.result(), 0);

        // Return in a field presses no button that was not made the default, and a listener may delete the dialog.
        auto* doomed = new ToolkitDialog;
        auto* edit = addTo(*doomed, new ToolkitPasswordEdit);
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
        for (const QString& message : {QString("<b>错误</b>"), "https://" + QString(300, 'a'), QString(500, '\n'),
                                       QString(100000, QChar(0x5b57))}) {
            ToolkitDialog dialog;
            dialog.setMessage(message);
            dialog.addButton("确定", true);
            dialog.show();
            QVERIFY(QTest::qWaitForWindowExposed(&dialog));
            QCOMPARE(dialog.message(), message);
            auto* label = dialog.findChild<QLabel*>("messageLabel");
            QCOMPARE(label->textFormat(), Qt::PlainText);
            QVERIFY(dialog.width() >= 300 && dialog.width() < 500 && dialog.height() < 1200);
            const QRect text = label->fontMetrics().boundingRect(QRect(0, 0, label->width(), 100000),
                                                                 Qt::AlignHCenter | Qt::TextWordWrap, label->text());
            QVERIFY(text.width() <= label->width() && text.height() <= label->height());
            QVERIFY(!label->geometry().intersects(dialog.buttons().constFirst()->geometry()));
        }
    }

    void surfaceFollowsTheThemeUnlessPinned()
    {
        ToolkitDialog pinned, follower;
        const auto surface = [](const ToolkitDialog& dialog) { return dialog.palette().color(QPalette::Window); };
        pinned.setSurface(ThemeHelper::LightType);
        for (const ThemeHelper::ColorType type : {ThemeHelper::DarkType, ThemeHelper::LightType}) {
            QApplication::setPalette(ThemeHelper::palette(type));
            QTRY_COMPARE(ThemeHelper::instance()->themeType(), type);
            QCOMPARE(surface(follower), ThemeHelper::palette(type).color(QPalette::Window));
            QVERIFY(surface(pinned).lightness() > 128);
        }
    }

    void hiddenPasswordStaysInside()
    {
        const QString secret = "S3cret&";
        ToolkitDialog dialog;
        auto* edit = addTo(dialog, new ToolkitPasswordEdit);
        QVERIFY(shown(dialog));
        QClipboard* clipboard = QGuiApplication::clipboard();
        clipboard->setText("before");
        edit->setText(secret);
        edit->selectAll();
        QTest::keyClick(edit, Qt::Key_C, Qt::ControlModifier);
        QTest::keyClick(edit, Qt::Key_X, Qt::ControlModifier);
        QCOMPARE(clipboard->text() + edit->text(), "before" + secret);
        QVERIFY(!edit->displayText().contains(secret) && !edit->dragEnabled());
        QVERIFY(edit->inputMethodHints() & Qt::ImhHiddenText);

        auto* echoButton = edit->findChild<QAbstractButton*>("echoButton");
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

    void spinnerSleepsUnseen()
    {
        QWidget window;
        ToolkitSpinner spinner(&window);
        const auto* timer = spinner.findChild<QTimer*>();
        spinner.start();
        QVERIFY(!timer->isActive());
        for (const bool visible : {true, false, true}) {
            window.setVisible(visible);
            QCOMPARE(timer->isActive(), visible);
        }
        spinner.stop();
        QVERIFY(!timer->isActive());
    }

    void buttonBoxIsExclusive()
    {
        ToolkitButtonBox box;
        auto* first = new ToolkitButtonBoxButton("一");
        auto* second = new ToolkitButtonBoxButton("二");
        box.setButtonList({first, second}, true);
        first->setChecked(true);
        QSignalSpy clicks(&box, &ToolkitButtonBox::buttonClicked);
        QVERIFY(shown(box));
        QTest::mouseClick(second, Qt::LeftButton);
        QVERIFY(second->isChecked() && !first->isChecked());
        second->setFocus(Qt::TabFocusReason);
        QTest::keyClick(second, Qt::Key_Left);
        QVERIFY(first->isChecked() && !second->isChecked() && first->hasFocus());
        // A second click cannot leave the box without a choice.
        QTest::mouseClick(first, Qt::LeftButton);
        QCOMPARE(box.checkedButton(), first);
        QCOMPARE(clicks.count(), 3);
    }

    void toolTipsReadAsGiven()
    {
        for (const QString text :
             {"运维管理处", "a < b > c", "<b>粗体</b>", "<img src='http://example.invalid/x.png'> & more", "&lt;b&gt;",
              "<?xml version=\"1.0\"?>"}) {
            const QString tip = ToolkitLabel::plainToolTip(text);
            QTextDocument document;
            document.setHtml(tip);
            QCOMPARE(Qt::mightBeRichText(tip) ? document.toPlainText() : tip, text);
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

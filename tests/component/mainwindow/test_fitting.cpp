// SPDX-License-Identifier: Apache-2.0
#include "closeguarddialog.h"
#include "mainwindow.h"
#include "modifydialog.h"
#include "noticedialog.h"
#include "resumedialog.h"
#include "spinerwin.h"
#include "toolkitapplication.h"
#include "toolkitlabel.h"

#include <QAbstractButton>
#include <QLineEdit>
#include <QPushButton>
#include <QtTest>

namespace
{

/// Room that a control's frame or box takes from its text on both sides together.
int surround(const QAbstractButton* button)
{
    return button->inherits("QCheckBox") ? 20 : 4;
}

/// What of the window's visible controls is cut off, as a text; empty where nothing is.
QString cutOff(const QWidget& window)
{
    QStringList faults;
    const auto fault = [&](const QWidget* widget, const QString& text) {
        faults += QStringLiteral("%1 \"%2\"").arg(QLatin1String(widget->metaObject()->className()), text);
    };
    const QList<QWidget*> widgets = window.findChildren<QWidget*>();
    for (const QWidget* widget : widgets) {
        if (widget->window() != &window || !widget->isVisible() ||
            widget->objectName().startsWith(QLatin1String("qt_")))
            continue;
        const QRegion shown = widget->visibleRegion();
        const QFontMetrics metrics = widget->fontMetrics();
        if (const auto* label = qobject_cast<const ToolkitLabel*>(widget)) {
            const QRect area = label->contentsRect();
            if (label->wordWrap()) {
                if (label->heightForWidth(label->width()) > label->height())
                    fault(label, label->text());
                continue;
            }
            const QRect ink = metrics.tightBoundingRect(label->text()).translated(0, label->baseline());
            const bool high = ink.top() < area.top() || ink.bottom() > area.bottom();
            if (high || metrics.horizontalAdvance(label->text()) > area.width())
                fault(label, label->text());
        } else if (const auto* button = qobject_cast<const QAbstractButton*>(widget)) {
            const QSize needed = metrics.size(Qt::TextShowMnemonic, button->text());
            const int ink = metrics.tightBoundingRect(button->text()).height();
            if (needed.width() + surround(button) > button->width() || ink > button->height())
                fault(button, button->text());
        } else if (const auto* edit = qobject_cast<const QLineEdit*>(widget)) {
            const QMargins margins = edit->textMargins();
            if (metrics.horizontalAdvance(edit->placeholderText()) > edit->width() - margins.left() - margins.right())
                fault(edit, edit->placeholderText());
        } else {
            continue;
        }
        // Nothing of a control lies outside its parents; labels may be empty.
        if (shown.boundingRect() != widget->rect())
            fault(widget, QStringLiteral("partly hidden"));
    }
    return faults.join(QStringLiteral(", "));
}

} // namespace

/// Every window at the scale factor that the environment asks for.
class TestFitting : public QObject
{
    Q_OBJECT

private slots:
    void scale() { QCOMPARE(qApp->devicePixelRatio(), qEnvironmentVariable("QT_SCALE_FACTOR").toDouble()); }
    void panel()
    {
        MainWindow window(nullptr, 1020);
        window.show();
        QVERIFY(QTest::qWaitForWindowExposed(&window));
        QTRY_VERIFY(!window.findChild<QLabel*>(QStringLiteral("macValue"))->text().isEmpty());
        QByteArray scenes = "{'code': 0, 'message': [{'scene_name': 'a', 'scene_code': 'a'},"
                            "{'scene_name': 'b', 'scene_code': 'b'}]}";
        scenes.replace('\'', '"');
        window.analyseEvnData(&scenes);
        QCOMPARE(window.height(), 565);
        for (const char* page : {"LoginInfo", "NetInfo"}) {
            window.findChild<QAbstractButton*>(QLatin1String(page))->click();
            QTest::qWait(0);
            QCOMPARE(cutOff(window), QString());
        }
    }
    void dialogs()
    {
        closeGuarddialog release(nullptr);
        ModifyDialog password(nullptr);
        NoticeDialog notice(QStringLiteral("zhangsan"), nullptr);
        resumeDialog integrity(nullptr);
        spinerWin waiting(nullptr);
        spinerWin finished(nullptr);
        finished.closing();
        ToolkitDialog box;
        notice.setTitle(QStringLiteral("消息详情"));
        notice.nextButton()->setText(QStringLiteral("下一条(...)"));
        integrity.setRepairTitle(QStringLiteral("关键文件被修改：/usr/bin/login"));
        box.setTitle(QStringLiteral("消息调用警告"));
        box.setMessage(QStringLiteral("网络异常，请稍后重试。").repeated(12));
        box.addButton(QStringLiteral("确定"), true, ToolkitDialog::ButtonRecommend);
        QWidget* windows[] = {&release, &password, &notice, &integrity, &waiting, &finished, &box};
        for (QWidget* window : windows) {
            window->show();
            QVERIFY(QTest::qWaitForWindowExposed(window));
            QVERIFY2(cutOff(*window).isEmpty(),
                     qPrintable(window->metaObject()->className() + (": " + cutOff(*window))));
            window->hide();
        }
    }
};

int main(int argc, char** argv)
{
    ToolkitApplication::loadPlatformPlugin();
    ToolkitApplication application(argc, argv);
    TestFitting test;
    return QTest::qExec(&test, argc, argv);
}

#include "test_fitting.moc"

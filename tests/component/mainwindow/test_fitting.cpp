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

/// What of the window's visible controls is cut off, as a text; empty where nothing is.
QString cutOff(const QWidget& window)
{
    QStringList faults;
    for (const QWidget* widget : window.findChildren<QWidget*>()) {
        if (widget->window() != &window || !widget->isVisible() || widget->objectName().startsWith("qt_"))
            continue;
        const QString text = widget->property("text").toString();
        const QFontMetrics metrics = widget->fontMetrics();
        bool fits = true;
        if (const auto* label = qobject_cast<const ToolkitLabel*>(widget)) {
            const QRect area = label->contentsRect();
            const QRect ink = metrics.tightBoundingRect(text).translated(0, label->baseline());
            fits = label->wordWrap() ? label->heightForWidth(label->width()) <= label->height()
                                     : ink.top() >= area.top() && ink.bottom() <= area.bottom() &&
                                           metrics.horizontalAdvance(text) <= area.width();
        } else if (qobject_cast<const QAbstractButton*>(widget)) {
            // What its frame or box takes from the text on both sides together.
            const int around = widget->inherits("QCheckBox") ? 20 : 4;
            fits = metrics.size(Qt::TextShowMnemonic, text).width() + around <= widget->width() &&
                   metrics.tightBoundingRect(text).height() <= widget->height();
        } else if (const auto* edit = qobject_cast<const QLineEdit*>(widget)) {
            const int room = edit->width() - edit->textMargins().left() - edit->textMargins().right();
            fits = metrics.horizontalAdvance(edit->placeholderText()) <= room;
        } else {
            continue;
        }
        // Nothing of a control lies outside its parents; labels may be empty.
        if (!fits || widget->visibleRegion().boundingRect() != widget->rect())
            faults += QString("%1 \"%2\"%3").arg(widget->metaObject()->className(), text, fits ? " partly hidden" : "");
    }
    return faults.join(", ");
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
        QTRY_VERIFY(!window.findChild<QLabel*>("macValue")->text().isEmpty());
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
        NoticeDialog notice("zhangsan", nullptr);
        resumeDialog integrity(nullptr);
        spinerWin waiting(nullptr);
        spinerWin finished(nullptr);
        finished.closing();
        ToolkitDialog box;
        notice.setTitle("消息详情");
        notice.nextButton()->setText("下一条(...)");
        integrity.setRepairTitle("关键文件被修改：/usr/bin/login");
        box.setTitle("消息调用警告");
        box.setMessage(QString("网络异常，请稍后重试。").repeated(12));
        box.addButton("确定", true, ToolkitDialog::ButtonRecommend);
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

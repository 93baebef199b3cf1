#pragma once

#include "toolkitdialog.h"

#include <QApplication>
#include <QTimer>
#include <QtTest>

#include <functional>

/// Closes every modal notice with Return, as a user would, for as long as it lives.
class NoticeCloser
{
public:
    NoticeCloser()
    {
        QObject::connect(&m_watch, &QTimer::timeout, [this] {
            auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
            if (!box)
                return;
            messages += (box->windowTitle().isEmpty() ? "" : box->windowTitle() + ':') + box->message();
            if (instead)
                return instead();
            QTest::keyClick(box, Qt::Key_Return);
        });
        m_watch.start(5);
    }

    /// What the notices said, each after its title and a colon where it had one.
    QStringList messages;
    /// Done instead of closing when set; must end the notice.
    std::function<void()> instead;

private:
    QTimer m_watch;
};

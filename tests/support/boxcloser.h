// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "toolkitdialog.h"

#include <QApplication>
#include <QStringList>
#include <QTimer>

#include <functional>

/// Closes every message box as soon as it is open, and keeps what it said.
class BoxCloser : public QObject
{
public:
    BoxCloser()
    {
        connect(&m_timer, &QTimer::timeout, this, &BoxCloser::closeBox);
        m_timer.start(5);
    }

    /// The title, where there is one, and the text of each box.
    QStringList texts;
    /// What happens instead of closing the next box.
    std::function<void()> instead;

private:
    void closeBox()
    {
        auto* box = qobject_cast<ToolkitDialog*>(QApplication::activeModalWidget());
        if (!box || box->metaObject() != &ToolkitDialog::staticMetaObject)
            return;
        texts.append(box->windowTitle() + box->message());
        if (instead)
            std::exchange(instead, nullptr)();
        else
            box->close();
    }

    QTimer m_timer;
};

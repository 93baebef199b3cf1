// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QFont>
#include <QWidget>
#include <QtTest>

/// Shows the window, and returns whether it got the keyboard.
inline bool shown(QWidget& window)
{
    window.show();
    return QTest::qWaitForWindowActive(&window);
}

/// The application's font, so many pixels high.
inline QFont font(int pixels)
{
    QFont font;
    font.setPixelSize(pixels);
    return font;
}

/// A rectangle of four numbers: left, top, width and height.
inline QRect rect(const QJsonValue& numbers)
{
    const QJsonArray n = numbers.toArray();
    return {n[0].toInt(), n[1].toInt(), n[2].toInt(), n[3].toInt()};
}

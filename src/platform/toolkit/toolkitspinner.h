// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QWidget>

class QTimer;

/**
 * A turning ring of spokes for work of unknown length. It wakes the program only while it is playing and shown. While
 * stopped it paints nothing.
 */
class ToolkitSpinner : public QWidget
{
    Q_OBJECT

public:
    explicit ToolkitSpinner(QWidget* parent = nullptr);

    void start();
    void stop();
    bool isPlaying() const { return m_playing; }

    QSize sizeHint() const override;

protected:
    void showEvent(QShowEvent* event) override;
    void hideEvent(QHideEvent* event) override;
    void paintEvent(QPaintEvent* event) override;

private:
    void updateTimer();

    QTimer* m_timer;
    bool m_playing = false;
    int m_step = 0;
};

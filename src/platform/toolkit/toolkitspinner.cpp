// SPDX-License-Identifier: Apache-2.0
#include "toolkitspinner.h"

#include <QPainter>
#include <QTimer>

namespace
{

constexpr int kSpokes = 12;
constexpr int kStepMs = 80;

} // namespace

ToolkitSpinner::ToolkitSpinner(QWidget* parent) : QWidget(parent), m_timer(new QTimer(this))
{
    setAccessibleName(QStringLiteral("正在处理"));
    m_timer->setInterval(kStepMs);
    connect(m_timer, &QTimer::timeout, this, [this] {
        m_step = (m_step + 1) % kSpokes;
        update();
    });
}

void ToolkitSpinner::start()
{
    m_playing = true;
    updateTimer();
}

void ToolkitSpinner::stop()
{
    m_playing = false;
    updateTimer();
}

QSize ToolkitSpinner::sizeHint() const
{
    return {20, 20};
}

void ToolkitSpinner::showEvent(QShowEvent* event)
{
    QWidget::showEvent(event);
    updateTimer();
}

void ToolkitSpinner::hideEvent(QHideEvent* event)
{
    QWidget::hideEvent(event);
    m_timer->stop();
}

void ToolkitSpinner::updateTimer()
{
    if (!m_playing || !isVisible())
        m_timer->stop();
    else if (!m_timer->isActive())
        m_timer->start();
    update();
}

void ToolkitSpinner::paintEvent(QPaintEvent*)
{
    if (!m_playing)
        return;
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.translate(QRectF(rect()).center());
    const qreal reach = qMin(width(), height()) / 2.0;
    QColor color = palette().color(QPalette::Link);
    for (int spoke = 0; spoke < kSpokes; ++spoke) {
        const int age = (m_step - spoke + kSpokes) % kSpokes;
        color.setAlpha(qMax(38, 255 - age * 22));
        painter.setPen(QPen(color, reach / 6, Qt::SolidLine, Qt::RoundCap));
        painter.drawLine(QPointF(0, -reach * 0.5), QPointF(0, -reach * 0.88));
        painter.rotate(360.0 / kSpokes);
    }
}

// SPDX-License-Identifier: Apache-2.0
#include "toolkitlabel.h"

#include <QFontInfo>
#include <QHelpEvent>
#include <QPainter>
#include <QStyle>
#include <QTextDocument>
#include <QToolTip>

ToolkitLabel::ToolkitLabel(QWidget* parent) : ToolkitLabel(QString(), parent)
{
}

ToolkitLabel::ToolkitLabel(const QString& text, QWidget* parent) : QLabel(parent)
{
    setTextFormat(Qt::PlainText);
    setText(text);
}

QString ToolkitLabel::plainToolTip(const QString& text)
{
    if (!Qt::mightBeRichText(text))
        return text;
    const QString escaped = text.toHtmlEscaped();
    // A tool tip that does not take the text for rich text would show the escapes.
    return Qt::mightBeRichText(escaped) ? escaped : QStringLiteral("<qt>") + escaped + QStringLiteral("</qt>");
}

void ToolkitLabel::shrinkFontToWidth()
{
    // Measuring loads the fonts, which a program does not need before it shows a window.
    m_shrinkWhenShown = !isVisible();
    if (!m_shrinkWhenShown)
        shrinkNow();
}

void ToolkitLabel::shrinkNow()
{
    constexpr int kSmallest = 8;
    QFont smaller = font();
    for (int size = QFontInfo(smaller).pixelSize();
         size > kSmallest && QFontMetrics(smaller).horizontalAdvance(text()) > contentsRect().width();) {
        smaller.setPixelSize(--size);
    }
    if (smaller != font())
        setFont(smaller);
}

int ToolkitLabel::baseline() const
{
    const QRect area = contentsRect();
    const QFontMetrics metrics = fontMetrics();
    int line = style()->itemTextRect(metrics, area, int(alignment()), true, text()).top() + metrics.ascent();
    // Measured on tall and deep glyphs, not on the text, so that neighbouring labels keep one baseline.
    const int low = line + metrics.tightBoundingRect(QStringLiteral("gj()")).bottom() - area.bottom();
    const int high = line + metrics.tightBoundingRect(QStringLiteral("年国(")).top() - area.top();
    if (low > 0)
        line -= qBound(0, low, qMax(0, high));
    return line;
}

bool ToolkitLabel::event(QEvent* event)
{
    if (event->type() == QEvent::Show && m_shrinkWhenShown) {
        m_shrinkWhenShown = false;
        shrinkNow();
    }
    if (event->type() == QEvent::ToolTip && toolTip().isEmpty() && overflows()) {
        QToolTip::showText(static_cast<QHelpEvent*>(event)->globalPos(), plainToolTip(text()), this);
        return true;
    }
    return QLabel::event(event);
}

bool ToolkitLabel::overflows() const
{
    return !wordWrap() && fontMetrics().size(0, text()).width() > contentsRect().width();
}

void ToolkitLabel::drawLine(QPainter& painter) const
{
    const QRect area = contentsRect();
    const Qt::Alignment side = QStyle::visualAlignment(layoutDirection(), alignment());
    const int slack = area.width() - fontMetrics().horizontalAdvance(text());
    int x = area.left();
    if (slack > 0 && (side & Qt::AlignHCenter))
        x += slack / 2;
    else if (slack > 0 && (side & Qt::AlignRight))
        x += slack;
    painter.drawText(x, baseline(), text());
}

void ToolkitLabel::paintEvent(QPaintEvent* event)
{
    if (text().isEmpty() || wordWrap() || text().contains(QLatin1Char('\n')))
        return QLabel::paintEvent(event);
    constexpr int kSlices = 14;
    constexpr int kSliceWidth = 2;
    QPainter painter(this);
    QColor color = palette().color(isEnabled() ? QPalette::Active : QPalette::Disabled, foregroundRole());
    painter.setPen(color);
    if (!overflows())
        return drawLine(painter);

    // In slices: a gradient pen draws glyphs as outlines, and a layer blends them differently. Both look bolder than
    // the text around them.
    const QRect area = contentsRect();
    const int fadeStart = area.right() + 1 - kSlices * kSliceWidth;
    const int alpha = color.alpha();
    for (int slice = 0; slice <= kSlices; ++slice) {
        const QRect body(area.left(), area.top(), fadeStart - area.left(), area.height());
        const QRect piece(fadeStart + (slice - 1) * kSliceWidth, area.top(), kSliceWidth, area.height());
        painter.setClipRect(slice == 0 ? body : piece);
        color.setAlpha(alpha * (kSlices - slice) / kSlices);
        painter.setPen(color);
        drawLine(painter);
    }
}

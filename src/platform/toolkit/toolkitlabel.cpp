#include "toolkitlabel.h"

#include <QFontInfo>
#include <QHelpEvent>
#include <QPainter>
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
    // Escaped text is shown escaped unless the tool tip takes it for rich text.
    return Qt::mightBeRichText(escaped) ? escaped : QStringLiteral("<qt>") + escaped + QStringLiteral("</qt>");
}

void ToolkitLabel::shrinkFontToWidth()
{
    constexpr int smallest = 8;
    QFont smaller = font();
    for (int size = QFontInfo(smaller).pixelSize();
         size > smallest && QFontMetrics(smaller).horizontalAdvance(text()) > contentsRect().width();) {
        smaller.setPixelSize(--size);
    }
    if (smaller != font())
        setFont(smaller);
}

void ToolkitLabel::makeRoomForDescenders()
{
    // The text is centred in, and clipped by, what the margins leave: a margin at the bottom would cut it there.
    setContentsMargins(0, -2, 0, 0);
}

bool ToolkitLabel::event(QEvent* event)
{
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

void ToolkitLabel::paintEvent(QPaintEvent* event)
{
    if (!overflows())
        return QLabel::paintEvent(event);
    constexpr int slices = 14;
    constexpr int sliceWidth = 2;
    const QRect area = contentsRect();
    const int fadeStart = area.right() + 1 - slices * sliceWidth;
    QColor color = palette().color(isEnabled() ? QPalette::Active : QPalette::Disabled, foregroundRole());
    const int alpha = color.alpha();
    QPainter painter(this);
    // In slices: a gradient pen draws glyphs as outlines, and a layer blends them differently; both look bolder than
    // the text around.
    for (int slice = 0; slice <= slices; ++slice) {
        const QRect body(area.left(), area.top(), fadeStart - area.left(), area.height());
        const QRect piece(fadeStart + (slice - 1) * sliceWidth, area.top(), sliceWidth, area.height());
        painter.setClipRect(slice == 0 ? body : piece);
        color.setAlpha(alpha * (slices - slice) / slices);
        painter.setPen(color);
        painter.drawText(area, Qt::AlignLeft | Qt::AlignVCenter, text());
    }
}

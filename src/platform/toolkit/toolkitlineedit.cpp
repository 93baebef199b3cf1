// SPDX-License-Identifier: Apache-2.0
#include "toolkitlineedit.h"

#include "toolkitlabel.h"

#include <QAccessible>
#include <QApplication>
#include <QEvent>
#include <QPainter>
#include <QTimer>

namespace
{

constexpr qreal kFrameRadius = 6;
constexpr int kSideMargin = 8;
constexpr int kBubblePadding = 8;
constexpr int kBubbleGap = 4;
constexpr int kMessageLength = 200;
const QColor kBubbleColor(0xb3, 0x26, 0x1e);

/// The alert's bubble: white on red in both themes.
class AlertBubble : public ToolkitLabel
{
public:
    explicit AlertBubble(QWidget* parent) : ToolkitLabel(parent)
    {
        setObjectName(QStringLiteral("alertBubble"));
        setAttribute(Qt::WA_TransparentForMouseEvents);
        setFocusPolicy(Qt::NoFocus);
        setWordWrap(true);
        setContentsMargins(kBubblePadding, kBubblePadding / 2, kBubblePadding, kBubblePadding / 2);
        QPalette colors;
        colors.setColor(QPalette::WindowText, Qt::white);
        setPalette(colors);
    }

protected:
    void paintEvent(QPaintEvent* event) override
    {
        {
            QPainter painter(this);
            painter.setRenderHint(QPainter::Antialiasing);
            painter.setPen(Qt::NoPen);
            painter.setBrush(kBubbleColor);
            painter.drawRoundedRect(rect(), kFrameRadius, kFrameRadius);
        }
        ToolkitLabel::paintEvent(event);
    }
};

} // namespace

ToolkitLineEdit::ToolkitLineEdit(QWidget* parent) : QLineEdit(parent), m_bubbleTimer(new QTimer(this))
{
    setFrame(false);
    setAttribute(Qt::WA_Hover);
    setTextMargins(kSideMargin, 0, kSideMargin, 0);
    // The field is painted here; only its text is left to the style.
    QPalette colors;
    colors.setColor(QPalette::Base, Qt::transparent);
    setPalette(colors);
    m_bubbleTimer->setSingleShot(true);
    connect(m_bubbleTimer, &QTimer::timeout, this, &ToolkitLineEdit::hideAlertMessage);
    connect(this, &QLineEdit::textChanged, this, [this] {
        if (m_bubble)
            placeBubble();
    });
}

ToolkitLineEdit::~ToolkitLineEdit()
{
    delete m_bubble;
}

void ToolkitLineEdit::setAlert(bool alert)
{
    if (m_alert == alert)
        return;
    m_alert = alert;
    update();
    QAccessible::State changed;
    changed.invalid = true;
    QAccessibleStateChangeEvent notice(this, changed);
    QAccessible::updateAccessibility(&notice);
    emit alertChanged(alert);
}

void ToolkitLineEdit::showAlertMessage(const QString& message, int ms)
{
    hideAlertMessage();
    if (message.isEmpty())
        return;
    m_alertMessage = message;
    m_bubble = new AlertBubble(window());
    m_bubble->setText(message.size() > kMessageLength ? message.left(kMessageLength) + QChar(0x2026) : message);
    window()->installEventFilter(this);
    placeBubble();
    m_bubble->show();
    m_bubble->raise();
    if (ms > 0)
        m_bubbleTimer->start(ms);
    QAccessibleEvent notice(m_bubble, QAccessible::Alert);
    QAccessible::updateAccessibility(&notice);
}

void ToolkitLineEdit::hideAlertMessage()
{
    m_bubbleTimer->stop();
    m_alertMessage.clear();
    if (!m_bubble)
        return;
    m_bubble->parentWidget()->removeEventFilter(this);
    m_bubble->hide();
    m_bubble->deleteLater();
    m_bubble = nullptr;
}

void ToolkitLineEdit::placeBubble()
{
    const QWidget* frame = m_bubble->parentWidget();
    const QPoint corner = mapTo(frame, QPoint(0, 0));
    const int room = qMax(60, frame->width() - corner.x() - kBubbleGap);
    const int wanted = m_bubble->fontMetrics().size(0, m_bubble->text()).width() + 2 * kBubblePadding + 2;
    const int textEnd = textMargins().left() + fontMetrics().horizontalAdvance(displayText()) + kBubblePadding;
    const int signs = width() - qMax(textMargins().right(), kBubbleGap);
    if (wanted <= signs - textEnd && m_bubble->heightForWidth(wanted) <= height()) {
        // Here it hides nothing, neither the next field nor a button.
        m_bubble->resize(wanted, m_bubble->heightForWidth(wanted));
        m_bubble->move(corner + QPoint(signs - wanted, (height() - m_bubble->height()) / 2));
        return;
    }
    const int width = qMin(wanted, qMin(room, qMax(this->width(), 60)));
    m_bubble->resize(width, m_bubble->heightForWidth(width));
    int top = corner.y() + height() + kBubbleGap;
    if (top + m_bubble->height() > frame->height())
        top = qMax(0, corner.y() - kBubbleGap - m_bubble->height());
    m_bubble->move(corner.x(), top);
}

QSize ToolkitLineEdit::sizeHint() const
{
    return QLineEdit::sizeHint().expandedTo(QSize(0, 36));
}

bool ToolkitLineEdit::event(QEvent* event)
{
    const bool handled = QLineEdit::event(event);
    if (m_bubble && (event->type() == QEvent::Move || event->type() == QEvent::Resize))
        placeBubble();
    return handled;
}

bool ToolkitLineEdit::eventFilter(QObject* watched, QEvent* event)
{
    if (m_bubble && watched == m_bubble->parentWidget() && event->type() == QEvent::LayoutRequest)
        QMetaObject::invokeMethod(
            this,
            [this] {
                if (m_bubble)
                    placeBubble();
            },
            Qt::QueuedConnection);
    return QLineEdit::eventFilter(watched, event);
}

void ToolkitLineEdit::hideEvent(QHideEvent* event)
{
    QLineEdit::hideEvent(event);
    if (!event->spontaneous())
        hideAlertMessage();
}

void ToolkitLineEdit::paintEvent(QPaintEvent* event)
{
    {
        QPainter painter(this);
        painter.setRenderHint(QPainter::Antialiasing);
        const QPalette& around = parentWidget() ? parentWidget()->palette() : QApplication::palette();
        const QColor base = around.color(isEnabled() ? QPalette::Base : QPalette::Window);
        QColor edge = palette().color(QPalette::Text);
        edge.setAlpha(isEnabled() && underMouse() ? 120 : 80);
        if (hasFocus())
            edge = palette().color(QPalette::Link);
        if (m_alert)
            edge = base.lightness() < 128 ? QColor(0xff, 0x8a, 0x80) : kBubbleColor;
        const qreal width = hasFocus() ? 2 : m_alert ? 1.5 : 1;
        painter.setPen(QPen(edge, width));
        painter.setBrush(base);
        const QRectF field = QRectF(rect()).adjusted(width / 2, width / 2, -width / 2, -width / 2);
        painter.drawRoundedRect(field, kFrameRadius, kFrameRadius);
        if (m_alert) {
            edge.setAlpha(24);
            painter.setPen(Qt::NoPen);
            painter.setBrush(edge);
            painter.drawRoundedRect(field, kFrameRadius, kFrameRadius);
        }
    }
    QLineEdit::paintEvent(event);
}

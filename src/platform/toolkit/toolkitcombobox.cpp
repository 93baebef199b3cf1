#include "toolkitcombobox.h"

#include "toolkitlabel.h"

#include <QAbstractItemView>
#include <QHelpEvent>
#include <QPainter>
#include <QToolTip>

namespace
{

constexpr int textMargin = 12;
constexpr int arrowRoom = 30;
constexpr qreal frameRadius = 6;

} // namespace

ToolkitComboBox::ToolkitComboBox(QWidget* parent) : QComboBox(parent)
{
    setAttribute(Qt::WA_Hover);
}

QRect ToolkitComboBox::textRect() const
{
    return rect().adjusted(textMargin, 0, -arrowRoom, 0);
}

void ToolkitComboBox::showPopup()
{
    // The list is a window of its own, which takes its colours from the application, and so does a palette that is
    // merely inherited: every colour has to be set.
    QPalette colors = palette();
    for (int role = 0; role < QPalette::NColorRoles; ++role) {
        for (const QPalette::ColorGroup group : {QPalette::Active, QPalette::Inactive, QPalette::Disabled})
            colors.setBrush(group, QPalette::ColorRole(role), colors.brush(group, QPalette::ColorRole(role)));
    }
    view()->setPalette(colors);
    QComboBox::showPopup();
}

bool ToolkitComboBox::event(QEvent* event)
{
    if (event->type() == QEvent::ToolTip && toolTip().isEmpty() &&
        fontMetrics().horizontalAdvance(currentText()) > textRect().width()) {
        QToolTip::showText(static_cast<QHelpEvent*>(event)->globalPos(), ToolkitLabel::plainToolTip(currentText()),
                           this);
        return true;
    }
    return QComboBox::event(event);
}

void ToolkitComboBox::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    QColor ink = palette().color(QPalette::Text);
    QColor edge = ink;
    edge.setAlpha(isEnabled() && underMouse() ? 90 : 50);
    const bool focused = hasFocus() && window()->testAttribute(Qt::WA_KeyboardFocusChange);
    const qreal width = focused ? 2 : 1;
    painter.setPen(QPen(focused ? palette().color(QPalette::Highlight) : edge, width));
    painter.setBrush(palette().color(QPalette::Base));
    painter.drawRoundedRect(QRectF(rect()).adjusted(width / 2, width / 2, -width / 2, -width / 2), frameRadius,
                            frameRadius);

    painter.setPen(ink);
    painter.drawText(textRect(), Qt::AlignLeft | Qt::AlignVCenter,
                     fontMetrics().elidedText(currentText(), Qt::ElideRight, textRect().width()));

    ink.setAlpha(150);
    painter.setPen(QPen(ink, 1.5, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
    painter.translate(this->width() - arrowRoom / 2.0, height() / 2.0);
    painter.drawPolyline(QPolygonF({QPointF(-4, -2), QPointF(0, 2), QPointF(4, -2)}));
}

// SPDX-License-Identifier: Apache-2.0
#include "toolkitbuttonbox.h"

#include "focusring.h"

#include <QButtonGroup>
#include <QHBoxLayout>
#include <QPainter>

namespace
{

constexpr qreal kTrackRadius = 8;
constexpr qreal kPlateInset = 3;

QColor withAlpha(QColor color, int alpha)
{
    color.setAlpha(alpha);
    return color;
}

} // namespace

ToolkitButtonBoxButton::ToolkitButtonBoxButton(const QString& text, QWidget* parent) : QAbstractButton(parent)
{
    setText(text);
    setCheckable(true);
    setFocusPolicy(Qt::StrongFocus);
    setAttribute(Qt::WA_Hover);
}

QSize ToolkitButtonBoxButton::sizeHint() const
{
    const QSize text = fontMetrics().size(Qt::TextShowMnemonic, this->text());
    return {text.width() + 32, text.height() + 14};
}

void ToolkitButtonBoxButton::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    const QColor ink = palette().color(QPalette::WindowText);
    const QColor accent = palette().color(QPalette::Link);
    const QRectF plate = QRectF(rect()).adjusted(kPlateInset, kPlateInset, -kPlateInset, -kPlateInset);
    const qreal radius = kTrackRadius - 2;

    if (isChecked() || isDown()) {
        painter.setPen(Qt::NoPen);
        painter.setBrush(withAlpha(Qt::black, 22));
        painter.drawRoundedRect(plate.translated(0, 1), radius, radius);
        painter.setPen(QPen(withAlpha(Qt::black, 26), 1));
        painter.setBrush(palette().color(QPalette::Base));
        painter.drawRoundedRect(plate.adjusted(0.5, 0.5, -0.5, -0.5), radius, radius);
    } else if (isEnabled() && underMouse()) {
        painter.setPen(Qt::NoPen);
        painter.setBrush(withAlpha(ink, 14));
        painter.drawRoundedRect(plate, radius, radius);
    }
    focusring::paint(painter, this, plate, radius);
    QFont textFont = font();
    if (isChecked())
        textFont.setWeight(QFont::DemiBold);
    painter.setFont(textFont);
    painter.setPen(!isEnabled()  ? palette().color(QPalette::Disabled, QPalette::ButtonText)
                   : isChecked() ? accent
                                 : withAlpha(ink, 190));
    painter.drawText(rect(), Qt::AlignCenter | Qt::TextShowMnemonic, text());
}

ToolkitButtonBox::ToolkitButtonBox(QWidget* parent)
    : QWidget(parent), m_group(new QButtonGroup(this)), m_layout(new QHBoxLayout(this))
{
    m_layout->setSpacing(0);
    m_layout->setContentsMargins(0, 0, 0, 0);
    m_layout->setAlignment(Qt::AlignCenter);
    connect(m_group, QOverload<QAbstractButton*>::of(&QButtonGroup::buttonClicked), this,
            &ToolkitButtonBox::buttonClicked);
}

void ToolkitButtonBox::setButtonList(const QList<QAbstractButton*>& buttons, bool checkable)
{
    const QList<QAbstractButton*> old = m_group->buttons();
    for (QAbstractButton* button : old) {
        m_group->removeButton(button);
        m_layout->removeWidget(button);
        if (!buttons.contains(button))
            delete button;
    }
    m_checkable = checkable;
    for (QAbstractButton* button : buttons)
        addButton(button);
}

void ToolkitButtonBox::addButton(QAbstractButton* button)
{
    button->setCheckable(m_checkable);
    // The group makes them exclusive already. This makes them radio buttons to assistive programs.
    button->setAutoExclusive(m_checkable);
    m_group->addButton(button);
    m_layout->addWidget(button);
}

QList<QAbstractButton*> ToolkitButtonBox::buttonList() const
{
    return m_group->buttons();
}

QAbstractButton* ToolkitButtonBox::checkedButton() const
{
    return m_group->checkedButton();
}

void ToolkitButtonBox::paintEvent(QPaintEvent*)
{
    QPainter painter(this);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.setPen(Qt::NoPen);
    painter.setBrush(withAlpha(palette().color(QPalette::WindowText), 18));
    painter.drawRoundedRect(rect(), kTrackRadius, kTrackRadius);
}

// SPDX-License-Identifier: Apache-2.0
#include "panel/infopage.h"

#include "displaytext.h"
#include "toolkitlabel.h"

#include <QGridLayout>

namespace
{

constexpr QSize kPageSize(278, 310);
constexpr QSize kCaptionSize(56, 18);
constexpr QSize kValueSize(170, 18);
/// The same on every page, so that the values keep their place when the page changes.
constexpr int kCaptionColumn = 76;
constexpr int kColumnGap = 14;
/// Eight rows at this distance fill the part of the page that the panel shows.
constexpr int kRowGap = 14;

void setTextColor(QWidget* widget, const QColor& color)
{
    QPalette palette = widget->palette();
    palette.setColor(QPalette::WindowText, color);
    palette.setColor(QPalette::Text, color);
    widget->setPalette(palette);
}

/// False for a text so short that it fits without measuring, which loads the fonts. Hardly a character is wider than
/// its font is high, and the label fades out what is.
bool mayOverflow(const ToolkitLabel& label, const QString& text)
{
    const int height = label.font().pixelSize();
    return height < 1 || text.size() * height > label.width();
}

} // namespace

InfoPage::InfoPage(const QVector<Row>& rows, QWidget* parent) : QWidget(parent)
{
    setFixedSize(kPageSize);
    auto* grid = new QGridLayout(this);
    grid->setContentsMargins(0, 0, 0, 0);
    grid->setHorizontalSpacing(kColumnGap);
    grid->setVerticalSpacing(kRowGap);
    grid->setColumnMinimumWidth(0, kCaptionColumn);
    grid->setColumnStretch(1, 1);
    for (int row = 0; row < rows.size(); ++row) {
        auto* caption = new ToolkitLabel(rows[row].caption, this);
        caption->setObjectName(QLatin1String(rows[row].captionName));
        caption->setFixedSize(kCaptionSize);
        setTextColor(caption, QColor(0, 0, 0, 150));

        auto* value = new ToolkitLabel(this);
        value->setObjectName(QLatin1String(rows[row].valueName));
        value->setFixedSize(kValueSize);
        setTextColor(value, QColor(0, 0, 0, 255));
        caption->setBuddy(value);

        grid->addWidget(caption, row, 0, Qt::AlignLeft);
        grid->addWidget(value, row, 1, Qt::AlignLeft);
        m_captions.append(caption);
        m_values.append(value);
        setValue(row, QString(), Overflow::Clip);
    }
    // What is left over goes below the last row.
    grid->setRowStretch(rows.size(), 1);
}

void InfoPage::setCaptionWidth(int row, int width)
{
    m_captions[row]->setFixedWidth(width);
}

void InfoPage::setValue(int row, const QString& whole, Overflow overflow)
{
    const QString text = zent::display::cut(whole);
    ToolkitLabel* label = m_values[row];
    // A screen reader meets the value alone; its name says what the value is, and says it whole.
    label->setAccessibleName(m_captions[row]->text() + QStringLiteral("：") + text);
    if (overflow == Overflow::Elide && mayOverflow(*label, text) &&
        label->fontMetrics().horizontalAdvance(text) > label->width()) {
        label->setText(label->fontMetrics().elidedText(text, Qt::ElideMiddle, label->width()));
        label->setToolTip(ToolkitLabel::plainToolTip(text));
    } else {
        label->setText(text);
    }
}

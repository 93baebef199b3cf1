// SPDX-License-Identifier: Apache-2.0
#include "panel/iconbutton.h"

#include "toolkitlabel.h"

#include <QHBoxLayout>

IconButton::IconButton(QWidget* parent)
    : QPushButton(parent), m_icon(new ToolkitLabel(this)), m_text(new ToolkitLabel(this))
{
    m_icon->setObjectName(QStringLiteral("label_icon"));
    m_text->setObjectName(QStringLiteral("label_text"));
    // Colours and clicks are the button's: the labels only draw.
    for (QLabel* label : {m_icon, m_text}) {
        label->setAttribute(Qt::WA_TransparentForMouseEvents);
        label->setForegroundRole(QPalette::ButtonText);
    }
    auto* layout = new QHBoxLayout(this);
    layout->setObjectName(QStringLiteral("horizontalLayout"));
    layout->addWidget(m_icon, 1);
    layout->addWidget(m_text, 3);
}

void IconButton::setIconImg(const QString& path)
{
    m_icon->setStyleSheet(QStringLiteral("QLabel{border-image:url(") + path + QStringLiteral(")}"));
}

void IconButton::setText(const QString& text)
{
    m_text->setText(text);
    setAccessibleName(text);
}

QSize IconButton::sizeHint() const
{
    // The push button itself has neither text nor icon; its contents are in the layout.
    return layout()->sizeHint();
}

QSize IconButton::minimumSizeHint() const
{
    return layout()->minimumSize();
}

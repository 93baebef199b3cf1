// SPDX-License-Identifier: Apache-2.0
#include "messagelabel.h"

#include <QAction>
#include <QClipboard>
#include <QGuiApplication>
#include <QKeyEvent>
#include <QTextBoundaryFinder>

namespace
{

constexpr int kVerticalMargin = 10;
constexpr int kNarrowest = 280;
constexpr int kWidest = 420;
constexpr int kMostCharacters = 1000;
constexpr int kMostLines = 20;
constexpr QChar kZeroWidthSpace(0x200b);
constexpr QChar kEllipsis(0x2026);

/// The part of a message that is shown.
QString cut(const QString& message)
{
    const QString shown = message.left(kMostCharacters).section(QLatin1Char('\n'), 0, kMostLines - 1);
    return shown.size() < message.size() ? shown + kEllipsis : shown;
}

/// The text with places to break what is too long for a line.
QString breakable(const QString& text)
{
    constexpr int kLongestWord = 24;
    QTextBoundaryFinder ends(QTextBoundaryFinder::Line, text);
    QString result;
    int word = 0;
    for (int at = 0; at < text.size(); ++at) {
        const QChar character = text.at(at);
        ends.setPosition(at);
        word = ends.isAtBoundary() ? 1 : word + 1;
        if (word > kLongestWord && !character.isLowSurrogate() && !character.isMark()) {
            result += kZeroWidthSpace;
            word = 1;
        }
        result += character;
    }
    return result;
}

} // namespace

MessageLabel::MessageLabel(QWidget* parent) : ToolkitLabel(parent)
{
    setObjectName(QStringLiteral("messageLabel"));
    setWordWrap(true);
    setAlignment(Qt::AlignCenter);
    setTextInteractionFlags(Qt::TextSelectableByMouse | Qt::TextSelectableByKeyboard);
    auto* copyAction = new QAction(QStringLiteral("复制"), this);
    connect(copyAction, &QAction::triggered, this, &MessageLabel::copy);
    addAction(copyAction);
    setContextMenuPolicy(Qt::ActionsContextMenu);
    hide();
}

void MessageLabel::setMessage(const QString& message)
{
    m_message = message;
    setText(breakable(cut(message)));
    setVisible(!message.isEmpty());
    updateSize();
}

void MessageLabel::updateSize()
{
    // A layout asks a wrapped label for its height at one width only, so both are fixed here.
    const int width = qBound(kNarrowest, fontMetrics().size(0, text()).width() + 2, kWidest);
    setFixedSize(width, heightForWidth(width) + 2 * kVerticalMargin);
}

void MessageLabel::copy() const
{
    QString text = hasSelectedText() ? selectedText() : m_message;
    text.replace(QChar::ParagraphSeparator, QLatin1Char('\n'));
    QGuiApplication::clipboard()->setText(text.remove(kZeroWidthSpace));
}

void MessageLabel::changeEvent(QEvent* event)
{
    ToolkitLabel::changeEvent(event);
    if (event->type() == QEvent::FontChange)
        updateSize();
}

void MessageLabel::keyPressEvent(QKeyEvent* event)
{
    if (event->matches(QKeySequence::Copy))
        copy();
    else
        ToolkitLabel::keyPressEvent(event);
}

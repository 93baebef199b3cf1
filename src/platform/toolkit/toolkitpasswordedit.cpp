// SPDX-License-Identifier: Apache-2.0
#include "toolkitpasswordedit.h"

#include "toolkittoolbutton.h"

#include <QAbstractButton>
#include <QAccessible>
#include <QClipboard>
#include <QGuiApplication>
#include <QKeyEvent>
#include <QPainter>
#include <QPainterPath>
#include <QX11Info>

#include <cstdlib>
#include <memory>
#include <xcb/xcb.h>

namespace
{

constexpr int kSignSize = 28;
constexpr int kSignInset = 4;
constexpr int kRevealKey = Qt::CTRL + Qt::Key_R;

/// Whether Caps Lock is on, as far as an X server can tell.
bool capsLockOn()
{
    if (!QX11Info::isPlatformX11())
        return false;
    xcb_connection_t* connection = QX11Info::connection();
    const xcb_query_pointer_cookie_t cookie = xcb_query_pointer(connection, QX11Info::appRootWindow());
    const std::unique_ptr<xcb_query_pointer_reply_t, decltype(&std::free)> reply(
        xcb_query_pointer_reply(connection, cookie, nullptr), &std::free);
    return reply && (reply->mask & XCB_MOD_MASK_LOCK);
}

/// An eye; struck through while it is checked, that is, while pressing it hides the text again.
class EyeButton : public QAbstractButton
{
public:
    explicit EyeButton(QWidget* parent) : QAbstractButton(parent)
    {
        setObjectName(QStringLiteral("echoButton"));
        setCheckable(true);
        // Not in the Tab order: Tab goes from one field to the next, and the field knows a key for this.
        setFocusPolicy(Qt::NoFocus);
        setCursor(Qt::ArrowCursor);
        setAttribute(Qt::WA_Hover);
        resize(kSignSize, kSignSize);
    }

protected:
    void paintEvent(QPaintEvent*) override
    {
        QPainter painter(this);
        painter.setRenderHint(QPainter::Antialiasing);
        QColor ink = palette().color(QPalette::Text);
        ink.setAlpha(underMouse() || isDown() ? 230 : 160);
        painter.setPen(QPen(ink, 1.4, Qt::SolidLine, Qt::RoundCap));
        painter.translate(QRectF(rect()).center());
        QPainterPath lids(QPointF(-7, 0));
        lids.quadTo(QPointF(0, -9), QPointF(7, 0));
        lids.quadTo(QPointF(0, 9), QPointF(-7, 0));
        painter.drawPath(lids);
        painter.drawEllipse(QPointF(0, 0), 2, 2);
        if (isChecked())
            painter.drawLine(QPointF(-5.5, 5.5), QPointF(5.5, -5.5));
    }
};

/// The sign of the Caps Lock key: an arrow up over a bar.
class CapsLockSign : public QWidget
{
public:
    explicit CapsLockSign(QWidget* parent) : QWidget(parent)
    {
        setObjectName(QStringLiteral("capsLockSign"));
        setCursor(Qt::ArrowCursor);
        setAccessibleName(QStringLiteral("大写锁定已打开"));
        setToolTip(QStringLiteral("大写锁定已打开"));
        resize(kSignSize, kSignSize);
        hide();
    }

protected:
    void paintEvent(QPaintEvent*) override
    {
        QPainter painter(this);
        painter.setRenderHint(QPainter::Antialiasing);
        painter.setPen(QPen(palette().color(QPalette::Text), 1.4, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
        painter.translate(QRectF(rect()).center());
        painter.drawPolygon(QPolygonF({QPointF(0, -6), QPointF(6, 0), QPointF(3, 0), QPointF(3, 3), QPointF(-3, 3),
                                       QPointF(-3, 0), QPointF(-6, 0)}));
        painter.drawLine(QPointF(-3, 6), QPointF(3, 6));
    }
};

/// Whether nobody but the user may know what is in the field.
bool isSecret(const ToolkitPasswordEdit& edit)
{
    return edit.echoMode() != QLineEdit::Normal || !edit.window()->isVisible();
}

void passOn(QAccessibleEvent* event);

/// A line edit tells assistive programs what is typed into it, letter by letter, hidden or not: here as stars.
void hideTypedText(QAccessibleEvent* event)
{
    const auto* edit = qobject_cast<ToolkitPasswordEdit*>(event->object());
    if (!edit || !isSecret(*edit))
        return passOn(event);
    const auto stars = [](const QString& text) { return QString(text.size(), QLatin1Char('*')); };
    if (event->type() == QAccessible::TextInserted) {
        const auto* inserted = static_cast<QAccessibleTextInsertEvent*>(event);
        QAccessibleTextInsertEvent hidden(event->object(), inserted->changePosition(), stars(inserted->textInserted()));
        hidden.setCursorPosition(inserted->cursorPosition());
        passOn(&hidden);
    } else if (event->type() == QAccessible::TextRemoved) {
        const auto* removed = static_cast<QAccessibleTextRemoveEvent*>(event);
        QAccessibleTextRemoveEvent hidden(event->object(), removed->changePosition(), stars(removed->textRemoved()));
        hidden.setCursorPosition(removed->cursorPosition());
        passOn(&hidden);
    } else if (event->type() == QAccessible::TextUpdated) {
        const auto* updated = static_cast<QAccessibleTextUpdateEvent*>(event);
        QAccessibleTextUpdateEvent hidden(event->object(), updated->changePosition(), stars(updated->textRemoved()),
                                          stars(updated->textInserted()));
        hidden.setCursorPosition(updated->cursorPosition());
        passOn(&hidden);
    } else {
        passOn(event);
    }
}

void passOn(QAccessibleEvent* event)
{
    // The platform's own way is the one without a handler.
    QAccessible::installUpdateHandler(nullptr);
    QAccessible::updateAccessibility(event);
    QAccessible::installUpdateHandler(hideTypedText);
}

} // namespace

ToolkitPasswordEdit::ToolkitPasswordEdit(QWidget* parent)
    : ToolkitLineEdit(parent), m_echoButton(new EyeButton(this)), m_capsSign(new CapsLockSign(this)),
      m_clearButton(new ToolkitToolButton(this))
{
    m_clearButton->setObjectName(QStringLiteral("clearButton"));
    m_clearButton->setAccessibleName(QStringLiteral("清空"));
    m_clearButton->setFocusPolicy(Qt::NoFocus);
    m_clearButton->setCursor(Qt::ArrowCursor);
    // The icon is drawn for light fields, and has to be seen on dark ones.
    m_clearButton->setIconTinted(true);
    m_clearButton->resize(kSignSize, kSignSize);
    m_clearButton->hide();
    connect(m_clearButton, &QAbstractButton::clicked, this, &ToolkitPasswordEdit::clear);
    connect(this, &QLineEdit::textChanged, this, &ToolkitPasswordEdit::updateClearButton);
    setDragEnabled(false);
    QAccessible::installUpdateHandler(hideTypedText);
    connect(m_echoButton, &QAbstractButton::toggled, this, &ToolkitPasswordEdit::setRevealed);
    setRevealed(false);
    arrange();
}

void ToolkitPasswordEdit::clear()
{
    // Unlike QLineEdit::clear(), which undo takes back.
    setText(QString());
    QClipboard* clipboard = QGuiApplication::clipboard();
    if (clipboard->ownsSelection())
        clipboard->clear(QClipboard::Selection);
}

void ToolkitPasswordEdit::setEchoButtonVisible(bool visible)
{
    m_echoButtonVisible = visible;
    m_echoButton->setVisible(visible);
    if (!visible)
        m_echoButton->setChecked(false);
    arrange();
}

void ToolkitPasswordEdit::setRevealed(bool revealed)
{
    setEchoMode(revealed ? QLineEdit::Normal : QLineEdit::Password);
    // A visible password is still one: input methods must not learn it.
    setAttribute(Qt::WA_InputMethodEnabled, false);
    setInputMethodHints((revealed ? Qt::ImhNone : Qt::ImhHiddenText) | Qt::ImhSensitiveData | Qt::ImhNoPredictiveText |
                        Qt::ImhNoAutoUppercase);
    const QString name = revealed ? QStringLiteral("隐藏密码") : QStringLiteral("显示密码");
    m_echoButton->setAccessibleName(name);
    const QString key = QKeySequence(kRevealKey).toString(QKeySequence::NativeText);
    m_echoButton->setAccessibleDescription(key);
    m_echoButton->setToolTip(name + QStringLiteral(" (%1)").arg(key));
}

void ToolkitPasswordEdit::setClearIcon(const QIcon& icon)
{
    m_clearButton->setIcon(icon);
    updateClearButton();
}

void ToolkitPasswordEdit::updateClearButton()
{
    const bool shown = !m_clearButton->icon().isNull() && !text().isEmpty();
    if (shown == m_clearButton->isVisibleTo(this))
        return;
    m_clearButton->setVisible(shown);
    arrange();
}

void ToolkitPasswordEdit::updateCapsLock()
{
    const bool shown = hasFocus() && capsLockOn();
    if (shown == m_capsSign->isVisibleTo(this))
        return;
    m_capsSign->setVisible(shown);
    arrange();
}

void ToolkitPasswordEdit::arrange()
{
    int right = width() - kSignInset;
    for (QWidget* sign : {static_cast<QWidget*>(m_echoButton), static_cast<QWidget*>(m_clearButton), m_capsSign}) {
        if (!sign->isVisibleTo(this))
            continue;
        right -= sign->width();
        sign->move(right, (height() - sign->height()) / 2);
    }
    QMargins margins = textMargins();
    margins.setRight(qMax(margins.left(), width() - right));
    setTextMargins(margins);
}

void ToolkitPasswordEdit::focusInEvent(QFocusEvent* event)
{
    ToolkitLineEdit::focusInEvent(event);
    updateCapsLock();
}

void ToolkitPasswordEdit::focusOutEvent(QFocusEvent* event)
{
    ToolkitLineEdit::focusOutEvent(event);
    updateCapsLock();
}

void ToolkitPasswordEdit::hideEvent(QHideEvent* event)
{
    ToolkitLineEdit::hideEvent(event);
    m_echoButton->setChecked(false);
}

void ToolkitPasswordEdit::keyPressEvent(QKeyEvent* event)
{
    updateCapsLock();
    // Cutting hidden text would delete it without putting it anywhere.
    if (echoMode() != QLineEdit::Normal && event->matches(QKeySequence::Cut)) {
        event->accept();
        return;
    }
    if (m_echoButtonVisible && QKeySequence(int(event->modifiers()) | event->key()) == QKeySequence(kRevealKey))
        return m_echoButton->toggle();
    ToolkitLineEdit::keyPressEvent(event);
}

void ToolkitPasswordEdit::keyReleaseEvent(QKeyEvent* event)
{
    updateCapsLock();
    ToolkitLineEdit::keyReleaseEvent(event);
}

void ToolkitPasswordEdit::resizeEvent(QResizeEvent* event)
{
    ToolkitLineEdit::resizeEvent(event);
    arrange();
}

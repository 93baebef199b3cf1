// SPDX-License-Identifier: Apache-2.0
#include "toolkitdialog.h"

#include "messagelabel.h"
#include "roundedframe.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"
#include "toolkitwarningbutton.h"
#include "windowmanagerhelper.h"

#include <QApplication>
#include <QEvent>
#include <QPainter>
#include <QPointer>
#include <QScreen>
#include <QTimer>
#include <QVBoxLayout>

namespace
{

constexpr int kCornerRadius = 12;
constexpr int kTitlebarHeight = 50;
constexpr int kBodyMargin = 10;
constexpr Qt::WindowFlags kFrameFlags = Qt::Dialog | Qt::FramelessWindowHint;

/// The sign of a warning, or of a critical message.
QPixmap sign(ToolkitDialog::BoxKind kind)
{
    QPixmap pixmap(64, 64);
    pixmap.fill(Qt::transparent);
    QPainter painter(&pixmap);
    painter.setRenderHint(QPainter::Antialiasing);
    painter.scale(2, 2);
    const bool critical = kind == ToolkitDialog::CriticalBox;
    // These colours stand out on light and on dark.
    const QColor face = critical ? QColor(0xe5, 0x39, 0x35) : QColor(0xc9, 0x6a, 0x00);
    painter.setBrush(face);
    painter.setPen(QPen(face, 4, Qt::SolidLine, Qt::RoundCap, Qt::RoundJoin));
    if (critical)
        painter.drawEllipse(QPointF(16, 16), 13, 13);
    else
        painter.drawPolygon(QPolygonF({QPointF(16, 5), QPointF(29, 27), QPointF(3, 27)}));
    painter.setPen(QPen(Qt::white, 3, Qt::SolidLine, Qt::RoundCap));
    if (critical) {
        painter.drawLine(QPointF(11, 11), QPointF(21, 21));
        painter.drawLine(QPointF(11, 21), QPointF(21, 11));
    } else {
        painter.drawLine(QPointF(16, 12), QPointF(16, 18));
        painter.drawPoint(QPointF(16, 24));
    }
    return pixmap;
}

/// Puts a dialog in the middle of another window. Qt would leave room above it for a frame, which it has not.
void placeOver(QWidget& dialog, const QWidget& window)
{
    dialog.adjustSize();
    const QRect room = window.screen()->availableGeometry();
    QRect place = dialog.rect();
    place.moveCenter(window.geometry().center());
    place.moveRight(qMin(place.right(), room.right()));
    place.moveBottom(qMin(place.bottom(), room.bottom()));
    dialog.move(qMax(place.left(), room.left()), qMax(place.top(), room.top()));
}

constexpr int kKeyboardSettlesMs = 200;

/// Some window managers give the keyboard back only to windows that are in the task bar. The request waits until they
/// have seen the dialog go: openbox answers an earlier one and then takes the keyboard away again.
void giveKeyboardTo(QWidget* window)
{
    QTimer::singleShot(kKeyboardSettlesMs, window, [window] {
        if (!window->isVisible() || QApplication::activeWindow())
            return;
        WindowManagerHelper::takePresentTime();
        window->activateWindow();
    });
}

} // namespace

ToolkitDialog::ToolkitDialog(QWidget* parent)
    : QDialog(parent, kFrameFlags), m_frame(new RoundedFrame(this, kCornerRadius)),
      m_titlebar(new ToolkitTitlebar(this)), m_message(new MessageLabel(this)), m_contentLayout(new QVBoxLayout),
      m_buttonLayout(new QHBoxLayout)
{
    m_titlebar->setFixedHeight(kTitlebarHeight);
    m_titlebar->setBackgroundTransparent(true);
    m_contentLayout->setSpacing(kBodyMargin);
    m_buttonLayout->setSpacing(kBodyMargin);

    auto* body = new QVBoxLayout;
    body->setContentsMargins(kBodyMargin, 0, kBodyMargin, 0);
    body->setSpacing(0);
    body->addWidget(m_message, 0, Qt::AlignHCenter);
    body->addLayout(m_contentLayout, 1);
    body->addLayout(m_buttonLayout);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(m_titlebar);
    layout->addLayout(body, 1);
    // This margin shrinks before the content of a dialog of fixed size is cut.
    layout->addSpacerItem(new QSpacerItem(0, kBodyMargin, QSizePolicy::Minimum, QSizePolicy::Maximum));

    updateSurface();
    connect(ThemeHelper::instance(), &ThemeHelper::themeTypeChanged, this, &ToolkitDialog::updateSurface);
}

void ToolkitDialog::setIcon(const QIcon& icon)
{
    setWindowIcon(icon);
}

void ToolkitDialog::setTitle(const QString& title)
{
    setWindowTitle(title);
}

void ToolkitDialog::setMessage(const QString& message)
{
    m_message->setMessage(message);
    updateAccessibleTexts();
}

QString ToolkitDialog::message() const
{
    return m_message->message();
}

void ToolkitDialog::tell(QWidget* parent, const QString& text, const QString& title, BoxKind kind)
{
    // On the heap, because the parent deletes the box when it goes away meanwhile.
    const QPointer<ToolkitDialog> box = new ToolkitDialog(parent);
    if (kind == WarningBox || kind == CriticalBox)
        box->setIcon(sign(kind));
    box->setTitle(title);
    box->setMessage(text);
    if (kind == BareBox)
        // As much room below the text as the title bar takes above it.
        box->layout()->setContentsMargins(0, 0, 0, kTitlebarHeight - kBodyMargin);
    else
        box->addButton(QStringLiteral("确定"), true, ButtonRecommend);
    if (parent)
        placeOver(*box, *parent->window());
    box->exec();
    delete box;
}

void ToolkitDialog::updateAccessibleTexts()
{
    // A screen reader announces a window by its name. Without a title, the message says what this is about.
    if (message().isEmpty())
        return;
    setAccessibleName(windowTitle().isEmpty() ? message() : windowTitle());
    setAccessibleDescription(windowTitle().isEmpty() ? QString() : message());
}

int ToolkitDialog::addButton(const QString& text, bool isDefault, ButtonType type)
{
    QString literal = text;
    literal.replace(QLatin1Char('&'), QLatin1String("&&"));
    QPushButton* button = nullptr;
    switch (type) {
    case ButtonRecommend:
        button = new ToolkitSuggestButton(literal, this);
        break;
    case ButtonWarning:
        button = new ToolkitWarningButton(literal, this);
        break;
    case ButtonNormal:
        button = new ToolkitPushButton(literal, this);
    }
    button->setAccessibleName(text);
    button->setAutoDefault(false);
    button->setDefault(isDefault);
    button->setSizePolicy(QSizePolicy::Expanding, QSizePolicy::Fixed);
    if (m_buttons.isEmpty())
        m_buttonLayout->setContentsMargins(0, kBodyMargin, 0, 0);
    m_buttonLayout->addWidget(button);
    const int index = m_buttons.size();
    m_buttons.append(button);
    connect(button, &QAbstractButton::clicked, this, [this, index, text] {
        const QPointer<ToolkitDialog> alive = this;
        emit buttonClicked(index, text);
        if (alive)
            done(index);
    });
    return index;
}

void ToolkitDialog::addContent(QWidget* content, Qt::Alignment alignment)
{
    m_contentLayout->addWidget(content, 0, alignment);
}

void ToolkitDialog::setSurface(ThemeHelper::ColorType surface)
{
    m_surface = surface;
    updateSurface();
}

void ToolkitDialog::updateSurface()
{
    setPalette(
        ThemeHelper::palette(m_surface == ThemeHelper::UnknownType ? ThemeHelper::instance()->themeType() : m_surface));
}

void ToolkitDialog::setVisible(bool visible)
{
    if (visible) {
        // A caller's setWindowFlags() may have left out the frame's flags, even the one that makes this a window.
        if ((windowFlags() & kFrameFlags) != kFrameFlags)
            setWindowFlags(windowFlags() | kFrameFlags);
        const QList<QPushButton*> buttons = findChildren<QPushButton*>();
        for (QPushButton* button : buttons)
            button->setAutoDefault(false);
        focusFirst();
    }
    const bool hadKeyboard = isActiveWindow();
    QDialog::setVisible(visible);
    if (!visible && hadKeyboard && parentWidget())
        giveKeyboardTo(parentWidget()->window());
}

void ToolkitDialog::focusFirst()
{
    if (focusWidget())
        return;
    for (QAbstractButton* button : qAsConst(m_buttons)) {
        if (static_cast<QPushButton*>(button)->isDefault())
            return button->setFocus();
    }
    for (QWidget* next = nextInFocusChain(); next != this; next = next->nextInFocusChain()) {
        const bool reachable = (next->focusPolicy() & Qt::TabFocus) && next->isEnabled() && next->isVisibleTo(this);
        if (reachable && isAncestorOf(next) && !m_titlebar->isAncestorOf(next))
            return next->setFocus();
    }
    m_titlebar->focusCloseButton();
}

bool ToolkitDialog::event(QEvent* event)
{
    const bool handled = QDialog::event(event);
    switch (event->type()) {
    case QEvent::WindowTitleChange:
        m_titlebar->setTitle(windowTitle());
        updateAccessibleTexts();
        break;
    case QEvent::WindowIconChange:
        if (testAttribute(Qt::WA_SetWindowIcon))
            m_titlebar->setIcon(windowIcon());
        break;
    default:
        break;
    }
    return handled;
}

void ToolkitDialog::paintEvent(QPaintEvent*)
{
    m_frame->paint(palette().color(QPalette::Window));
}

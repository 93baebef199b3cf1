#include "toolkitdialog.h"

#include "roundedsurface.h"
#include "toolkitlabel.h"
#include "toolkitsuggestbutton.h"
#include "toolkittitlebar.h"
#include "toolkitwarningbutton.h"
#include "windowkeys.h"
#include "windowmanagerhelper.h"

#include <QKeyEvent>
#include <QPointer>
#include <QVBoxLayout>

namespace
{

constexpr int cornerRadius = 12;
constexpr int titlebarHeight = 50;
constexpr int bodyMargin = 10;
constexpr int narrowestMessage = 280;
constexpr int widestMessage = 420;
constexpr int longestMessage = 1000;
constexpr int messageLines = 20;
constexpr Qt::WindowFlags frameFlags = Qt::Dialog | Qt::FramelessWindowHint;

/// A message fit for a label: of bounded length, and with places to break words too long for a line.
QString displayText(const QString& message)
{
    constexpr int longestWord = 24;
    constexpr ushort zeroWidthSpace = 0x200b;
    QString shown;
    int lines = 1;
    int word = 0;
    for (const QChar character : message.left(longestMessage)) {
        if (character == QLatin1Char('\n') && ++lines > messageLines)
            break;
        word = character.isSpace() ? 0 : word + 1;
        if (word > longestWord && !character.isLowSurrogate() && !character.isMark()) {
            shown += QChar(zeroWidthSpace);
            word = 1;
        }
        shown += character;
    }
    return lines > messageLines || message.size() > longestMessage ? shown + QChar(0x2026) : shown;
}

} // namespace

ToolkitDialog::ToolkitDialog(QWidget* parent)
    : QDialog(parent, frameFlags), m_titlebar(new ToolkitTitlebar(this)), m_messageLabel(new ToolkitLabel(this)),
      m_contentLayout(new QVBoxLayout), m_buttonLayout(new QHBoxLayout)
{
    setAttribute(Qt::WA_TranslucentBackground);
    m_titlebar->setFixedHeight(titlebarHeight);
    m_titlebar->setBackgroundTransparent(true);
    m_messageLabel->setObjectName(QStringLiteral("messageLabel"));
    m_messageLabel->setWordWrap(true);
    m_messageLabel->setAlignment(Qt::AlignHCenter | Qt::AlignVCenter);
    m_messageLabel->hide();
    m_contentLayout->setSpacing(bodyMargin);
    m_buttonLayout->setSpacing(bodyMargin);

    auto* body = new QVBoxLayout;
    body->setContentsMargins(bodyMargin, 0, bodyMargin, 0);
    body->setSpacing(0);
    body->addWidget(m_messageLabel, 0, Qt::AlignHCenter);
    body->addLayout(m_contentLayout, 1);
    body->addLayout(m_buttonLayout);

    auto* layout = new QVBoxLayout(this);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(m_titlebar);
    layout->addLayout(body, 1);
    // A margin that gives way before the content of a dialog of fixed size is cut.
    layout->addSpacerItem(new QSpacerItem(0, bodyMargin, QSizePolicy::Minimum, QSizePolicy::Maximum));

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
    m_message = message;
    m_messageLabel->setText(displayText(message));
    m_messageLabel->setVisible(!message.isEmpty());
    updateAccessibleTexts();
    updateMessageSize();
}

void ToolkitDialog::updateAccessibleTexts()
{
    // A screen reader announces a window by its name: without a title it is the message that says what this is about.
    if (m_message.isEmpty())
        return;
    setAccessibleName(windowTitle().isEmpty() ? m_message : windowTitle());
    setAccessibleDescription(windowTitle().isEmpty() ? QString() : m_message);
}

void ToolkitDialog::updateMessageSize()
{
    // A wrapped label tells a window's layout its height for one width only, so both are settled here.
    const QFontMetrics metrics = m_messageLabel->fontMetrics();
    const int wanted = metrics.size(0, m_messageLabel->text()).width() + 2;
    const int width = qBound(narrowestMessage, wanted, widestMessage);
    const QRect area(0, 0, width, QWIDGETSIZE_MAX);
    const QRect needed = metrics.boundingRect(area, Qt::AlignHCenter | Qt::TextWordWrap, m_messageLabel->text());
    m_messageLabel->setFixedSize(width, needed.height() + 2 * bodyMargin);
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
        m_buttonLayout->setContentsMargins(0, bodyMargin, 0, 0);
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
        // A caller's setWindowFlags() may have left out the frame's own, even the one that makes this a window.
        if ((windowFlags() & frameFlags) != frameFlags)
            setWindowFlags(windowFlags() | frameFlags);
        const QList<QPushButton*> buttons = findChildren<QPushButton*>();
        for (QPushButton* button : buttons)
            button->setAutoDefault(false);
        focusFirst();
    }
    QDialog::setVisible(visible);
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
    case QEvent::FontChange:
        updateMessageSize();
        break;
    case QEvent::Show:
        updateShape();
        break;
    case QEvent::WinIdChange:
        if (isVisible())
            updateShape();
        break;
    default:
        break;
    }
    return handled;
}

void ToolkitDialog::keyPressEvent(QKeyEvent* event)
{
    if (!windowkeys::handle(this, event))
        QDialog::keyPressEvent(event);
}

void ToolkitDialog::resizeEvent(QResizeEvent* event)
{
    QDialog::resizeEvent(event);
    if (isVisible())
        updateShape();
}

void ToolkitDialog::updateShape()
{
    m_composited = roundedsurface::applyShape(this, cornerRadius);
}

void ToolkitDialog::paintEvent(QPaintEvent*)
{
    // A compositing manager that starts or stops exposes the windows: the place to notice it without a watcher.
    if (m_composited != WindowManagerHelper::instance()->hasComposite())
        QMetaObject::invokeMethod(this, &ToolkitDialog::updateShape, Qt::QueuedConnection);
    roundedsurface::paint(this, palette().color(QPalette::Window), cornerRadius, !m_composited);
}

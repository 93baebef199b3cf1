// SPDX-License-Identifier: Apache-2.0
#include "toolkittitlebar.h"

#include "focusring.h"
#include "toolkitlabel.h"

#include <QApplication>
#include <QHBoxLayout>
#include <QMenu>
#include <QMouseEvent>
#include <QPainter>
#include <QToolButton>
#include <QWindow>

namespace
{

constexpr int kButtonSize = 28;
constexpr int kIconExtent = 20;

/// A button whose sign is drawn from lines, so that it is sharp at every scale and follows the palette.
class SignButton : public QToolButton
{
public:
    enum class Sign { Close, Menu };

    SignButton(Sign sign, const QString& name, QWidget* parent) : QToolButton(parent), m_sign(sign)
    {
        setFixedSize(kButtonSize, kButtonSize);
        setAccessibleName(name);
        setToolTip(name);
        setAttribute(Qt::WA_Hover);
        setFocusPolicy(Qt::TabFocus);
        // In this mode assistive programs are offered no press of the button, even while it has no menu.
        if (sign == Sign::Menu)
            setPopupMode(QToolButton::InstantPopup);
    }

protected:
    void paintEvent(QPaintEvent*) override
    {
        QPainter painter(this);
        painter.setRenderHint(QPainter::Antialiasing);
        QColor ink = palette().color(QPalette::WindowText);
        if (isDown() || underMouse()) {
            ink.setAlpha(isDown() ? 40 : 20);
            painter.setPen(Qt::NoPen);
            painter.setBrush(ink);
            painter.drawRoundedRect(rect(), 6, 6);
        }
        focusring::paint(painter, this, rect(), 6);
        ink.setAlpha(isDown() || underMouse() ? 230 : 170);
        painter.setPen(QPen(ink, 1.4, Qt::SolidLine, Qt::RoundCap));
        painter.translate(QRectF(rect()).center());
        constexpr qreal kReach = 4.5;
        if (m_sign == Sign::Close) {
            painter.drawLine(QPointF(-kReach, -kReach), QPointF(kReach, kReach));
            painter.drawLine(QPointF(-kReach, kReach), QPointF(kReach, -kReach));
        } else {
            for (const qreal y : {-4.5, -0.5, 3.5})
                painter.drawLine(QPointF(-kReach, y), QPointF(kReach, y));
        }
    }

private:
    Sign m_sign;
};

} // namespace

ToolkitTitlebar::ToolkitTitlebar(QWidget* parent)
    : QWidget(parent), m_icon(new ToolkitLabel(this)), m_title(new ToolkitLabel(this)),
      m_menuButton(new SignButton(SignButton::Sign::Menu, QStringLiteral("菜单"), this)),
      m_closeButton(new SignButton(SignButton::Sign::Close, QStringLiteral("关闭"), this))
{
    m_closeButton->setObjectName(QStringLiteral("titlebarCloseButton"));
    connect(m_closeButton, &QToolButton::clicked, this, [this] { window()->close(); });

    auto* layout = new QHBoxLayout(this);
    layout->setContentsMargins(12, 0, 10, 0);
    layout->setSpacing(6);
    layout->addWidget(m_icon);
    layout->addWidget(m_title, 1);
    layout->addWidget(m_menuButton);
    layout->addWidget(m_closeButton);
    m_icon->hide();
    m_menuButton->hide();
    setBackgroundTransparent(false);
}

void ToolkitTitlebar::setIcon(const QIcon& icon)
{
    m_icon->setPixmap(icon.pixmap(window()->windowHandle(), QSize(kIconExtent, kIconExtent)));
    m_icon->setVisible(!icon.isNull());
}

void ToolkitTitlebar::setTitle(const QString& title)
{
    m_title->setText(title);
}

QString ToolkitTitlebar::title() const
{
    return m_title->text();
}

void ToolkitTitlebar::setMenu(QMenu* menu)
{
    m_menuButton->setMenu(menu);
    updateMenuButton();
}

void ToolkitTitlebar::setMenuVisible(bool visible)
{
    m_menuVisible = visible;
    updateMenuButton();
}

void ToolkitTitlebar::updateMenuButton()
{
    m_menuButton->setVisible(m_menuVisible && m_menuButton->menu());
}

void ToolkitTitlebar::focusCloseButton()
{
    m_closeButton->setFocus();
}

void ToolkitTitlebar::setBackgroundTransparent(bool transparent)
{
    setAutoFillBackground(!transparent);
}

void ToolkitTitlebar::mousePressEvent(QMouseEvent* event)
{
    if (event->button() != Qt::LeftButton)
        return QWidget::mousePressEvent(event);
    m_pressed = true;
    m_dragging = false;
    m_pressPosition = event->globalPos();
    m_windowPosition = window()->pos();
}

void ToolkitTitlebar::mouseMoveEvent(QMouseEvent* event)
{
    if (!m_pressed)
        return QWidget::mouseMoveEvent(event);
    const QPoint distance = event->globalPos() - m_pressPosition;
    if (!m_dragging) {
        if (distance.manhattanLength() < QApplication::startDragDistance())
            return;
        m_dragging = true;
        emit windowDragged();
    }
    // A Wayland client cannot place its windows; the compositor moves them for it.
    if (QGuiApplication::platformName().startsWith(QLatin1String("wayland"))) {
        m_pressed = false;
        if (QWindow* handle = window()->windowHandle())
            handle->startSystemMove();
        return;
    }
    window()->move(m_windowPosition + distance);
}

void ToolkitTitlebar::mouseReleaseEvent(QMouseEvent* event)
{
    m_pressed = false;
    m_dragging = false;
    QWidget::mouseReleaseEvent(event);
}

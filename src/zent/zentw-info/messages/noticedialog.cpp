// SPDX-License-Identifier: Apache-2.0
#include "messages/noticedialog.h"

#include "displaytext.h"
#include "focusring.h"
#include "messages/notification.h"
#include "screen/screens.h"
#include "screen/showwindow.h"
#include "toolkitblurframe.h"
#include "toolkitlabel.h"
#include "toolkitsuggestbutton.h"
#include "windowmanagerhelper.h"

#include <QBoxLayout>
#include <QCloseEvent>
#include <QDebug>
#include <QPainter>
#include <QPlainTextEdit>
#include <QPointer>

namespace
{

constexpr QSize kDialogSize(428, 450);
constexpr int kFrameWidth = 400;
constexpr int kTitleHeight = 60;
constexpr int kContentHeight = 255;
constexpr QSize kLineSize(388, 1);
constexpr QSize kButtonSize(178, 38);
constexpr QSize kWideButtonSize(390, 38);
constexpr int kRefreshDelayMs = 1000;
constexpr int kOpaque = 255;

QString closeText()
{
    return QStringLiteral("关闭");
}

/// A text to read: literal, scrolled by wheel and keys without a scroll bar, and left by Tab.
class TextView : public QPlainTextEdit
{
public:
    explicit TextView(QWidget* parent) : QPlainTextEdit(parent)
    {
        setObjectName(QStringLiteral("plainTextEdit"));
        setReadOnly(true);
        setTabChangesFocus(true);
        setVerticalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
        setHorizontalScrollBarPolicy(Qt::ScrollBarAlwaysOff);
        setWordWrapMode(QTextOption::WrapAtWordBoundaryOrAnywhere);
        setFrameShape(QFrame::NoFrame);
        viewport()->setAutoFillBackground(false);
    }

protected:
    void paintEvent(QPaintEvent* event) override
    {
        QPlainTextEdit::paintEvent(event);
        QPainter painter(viewport());
        painter.setRenderHint(QPainter::Antialiasing);
        focusring::paint(painter, this, viewport()->rect(), 4);
    }
};

} // namespace

NoticeDialog::NoticeDialog(const QString& userName, QWidget* parent) : ToolkitDialog(parent), m_userName(userName)
{
    createInterface();
}

QPushButton* NoticeDialog::firstButton() const
{
    return m_firstButton;
}

QPushButton* NoticeDialog::nextButton() const
{
    return m_nextButton;
}

void NoticeDialog::createInterface()
{
    setSurface(ThemeHelper::LightType);
    setIcon(QIcon(QStringLiteral(":/images/infologo.svg")));
    setFixedSize(kDialogSize);
    zent::screens::placeCentre(*this);

    m_contentFrame = new ToolkitBlurFrame(this);
    m_contentFrame->setObjectName(QStringLiteral("informationWidget"));
    m_contentFrame->setFixedWidth(kFrameWidth);
    if (!WindowManagerHelper::instance()->hasBlurWindow())
        m_contentFrame->setMaskAlpha(kOpaque);

    m_senderLabel = createDetailLabel();
    m_timeLabel = createDetailLabel();
    auto* details = new QHBoxLayout;
    details->addWidget(m_senderLabel, 1, Qt::AlignLeft);
    details->addWidget(m_timeLabel, 0, Qt::AlignRight);
    auto* line = new QFrame(m_contentFrame);
    line->setObjectName(QStringLiteral("line"));
    line->setFrameShape(QFrame::HLine);
    line->setFrameShadow(QFrame::Plain);
    line->setFixedSize(kLineSize);
    QPalette lineColors = line->palette();
    lineColors.setColor(QPalette::WindowText, QColor(0, 0, 0, 40));
    line->setPalette(lineColors);

    auto* layout = new QVBoxLayout(m_contentFrame);
    layout->setObjectName(QStringLiteral("mainLayout"));
    layout->setSpacing(3);
    layout->setContentsMargins(5, 5, 5, 5);
    layout->addLayout(details);
    layout->addWidget(line, 0, Qt::AlignHCenter);
    layout->addLayout(createButtons());
    addContent(m_contentFrame, Qt::AlignHCenter);
}

void NoticeDialog::createTextViews()
{
    if (m_titleView)
        return;
    m_titleView = createTextView(kTitleHeight, QFont::Medium, QStringLiteral("消息标题"));
    m_contentView = createTextView(kContentHeight, QFont::Normal, QStringLiteral("消息内容"));
    auto* layout = qobject_cast<QVBoxLayout*>(m_contentFrame->layout());
    layout->insertWidget(0, m_titleView);
    // Above the buttons, also for Tab.
    layout->insertWidget(layout->count() - 1, m_contentView);
    setTabOrder(m_titleView, m_contentView);
    setTabOrder(m_contentView, m_firstButton);
    setTabOrder(m_firstButton, m_nextButton);
}

QPlainTextEdit* NoticeDialog::createTextView(int height, int weight, const QString& accessibleName)
{
    auto* view = new TextView(m_contentFrame);
    view->setAccessibleName(accessibleName);
    view->setFixedHeight(height);
    QFont font = view->font();
    font.setPixelSize(14);
    font.setWeight(weight);
    view->setFont(font);
    return view;
}

QLabel* NoticeDialog::createDetailLabel()
{
    auto* label = new ToolkitLabel(m_contentFrame);
    QFont font = label->font();
    font.setPixelSize(12);
    label->setFont(font);
    QColor color(Qt::black);
    color.setAlphaF(0.7);
    QPalette colors = label->palette();
    colors.setColor(QPalette::WindowText, color);
    label->setPalette(colors);
    return label;
}

QLayout* NoticeDialog::createButtons()
{
    m_firstButton = new ToolkitPushButton(closeText(), m_contentFrame);
    m_firstButton->setObjectName(QStringLiteral("closeButton"));
    m_nextButton = new ToolkitSuggestButton(QStringLiteral("下一条"), m_contentFrame);
    m_nextButton->setObjectName(QStringLiteral("nextButton"));
    auto* layout = new QHBoxLayout;
    layout->setSpacing(0);
    for (ToolkitPushButton* button : {m_firstButton, static_cast<ToolkitPushButton*>(m_nextButton)}) {
        // A complete palette: a widget with a style sheet takes the colours that it lacks from the application's
        // palette.
        QPalette colors = ThemeHelper::palette(ThemeHelper::LightType);
        colors.setColor(QPalette::ButtonText, Qt::white);
        button->setPalette(colors);
        button->setFixedSize(kButtonSize);
    }
    m_firstButton->setStyleSheet(QStringLiteral("color:black;"));
    layout->addWidget(m_firstButton);
    layout->addStretch();
    layout->addWidget(m_nextButton);
    return layout;
}

void NoticeDialog::showNotice()
{
    qDebug() << "showNotice";
    // The request is still to come, and each wait inside another takes a piece of the stack.
    if (m_waits)
        return;
    m_waits = true;
    const QPointer<NoticeDialog> self = this;
    QNotification::msleep(kRefreshDelayMs);
    // Events were let through: the dialog or the service may be gone.
    if (!self)
        return;
    m_waits = false;
    if (!QNotification::qInstance)
        return;
    QNotification::qInstance->getNotifyMessageList(m_userName, true, 1, 1,
                                                   [self](bool ok, const NotifyMessageResponse& response) {
                                                       if (self)
                                                           self->onMessageList(ok, response);
                                                   });
}

void NoticeDialog::onMessageList(bool ok, const NotifyMessageResponse& response)
{
    qDebug() << "noticeDialog::getNotifyMessageList()-01:" << (ok ? "true" : "false");
    if (!ok)
        return;
    m_total = response.total;
    qDebug() << "noticeDialog::getNotifyMessageList()-02:" << m_total;
    m_offersRead = m_total < 2 && !response.messages.isEmpty();
    if (response.messages.isEmpty()) {
        m_firstButton->show();
        m_nextButton->hide();
        m_firstButton->setText(closeText());
        return;
    }
    qDebug() << "noticeDialog::getNotifyMessageList()-03:";
    showMessage(response.messages.constFirst());
    updateButtons();
    // The next button loses the focus while it is disabled, by default to the close button, where a second Return
    // would close the dialog.
    if (!isVisible() || !m_contentFrame->isAncestorOf(focusWidget()))
        m_contentView->setFocus();
    zent::showActive(*this);
    m_nextButton->setEnabled(true);
}

void NoticeDialog::showMessage(const NotifyMessage& message)
{
    createTextViews();
    setTitle(QStringLiteral("消息详情"));
    m_titleView->setPlainText(zent::display::cut(message.title));
    m_senderLabel->setText(QStringLiteral("发送人: ") + zent::display::cut(message.send_uid));
    m_timeLabel->setText(QNotification::formatTime(message.created_at, true));
    m_contentView->setPlainText(zent::display::cut(message.content, zent::display::kContentLength));
    m_currentUuid = message.uuid;
}

void NoticeDialog::updateButtons()
{
    m_firstButton->setFixedSize(m_offersRead ? kWideButtonSize : kButtonSize);
    m_firstButton->setText(m_offersRead ? QStringLiteral("已读") : closeText());
    m_firstButton->show();
    m_nextButton->setVisible(!m_offersRead);
    if (!m_offersRead)
        m_nextButton->setText(QStringLiteral("下一条(%1)").arg(QNotification::formatUnReadNumber(m_total)));
}

void NoticeDialog::closeEvent(QCloseEvent* event)
{
    event->ignore();
    hide();
}

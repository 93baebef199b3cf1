// SPDX-License-Identifier: Apache-2.0
#include "panel/infowidget.h"

#include "displaytext.h"
#include "panel/infopage.h"
#include "panel/lunarcalendar.h"
#include "screen/screens.h"
#include "screen/showwindow.h"
#include "themehelper.h"
#include "toolkitbuttonbox.h"
#include "toolkitcombobox.h"
#include "toolkitlabel.h"
#include "toolkittoolbutton.h"

#include <QCheckBox>
#include <QCoreApplication>
#include <QDateTime>
#include <QDebug>
#include <QFrame>
#include <QHBoxLayout>
#include <QLocale>
#include <QTimer>
#include <QVBoxLayout>

namespace
{

constexpr int kPanelWidth = 300;
constexpr int kPanelHeight = 469;
constexpr int kPanelHeightWithScenes = 515;
constexpr QSize kLineSize(298, 1);
constexpr int kSceneRowIndex = 7;
/// Where the pages begin in their container, below the button box.
constexpr int kPagesTop = 52;
/// Added to the layout's right margin, it makes the margins on both sides look the same.
constexpr int kRightInset = 5;
constexpr int kDateRefreshMs = 1000000;

QString shared(const char* text)
{
    return QCoreApplication::translate("DMainWindows", text);
}

/// Lays the separator out across the whole panel, beyond the margins that hold the rest.
class SeparatorItem : public QWidgetItem
{
public:
    using QWidgetItem::QWidgetItem;
    QSize sizeHint() const override { return {0, kLineSize.height()}; }
    QSize minimumSize() const override { return sizeHint(); }
    void setGeometry(const QRect& rect) override
    {
        widget()->move((widget()->parentWidget()->width() - kLineSize.width()) / 2, rect.y());
    }
};

} // namespace

InfoWidget::InfoWidget(QWidget* parent, bool showRelease) : QWidget(parent)
{
    // Black texts need a light surface whatever the desktop's theme.
    setPalette(ThemeHelper::palette(ThemeHelper::LightType));
    m_baseFont = QFont(QStringLiteral("Source Han Sans CN"), 14, QFont::Normal);
    m_baseFont.setPixelSize(14);
    setFont(m_baseFont);

    m_line = new QFrame(this);
    m_line->setObjectName(QStringLiteral("line"));
    m_line->setFrameShape(QFrame::HLine);
    m_line->setFixedSize(kLineSize);
    QPalette linePalette = m_line->palette();
    linePalette.setColor(QPalette::WindowText, QColor(0, 0, 0, 36));
    m_line->setPalette(linePalette);

    // What can take the focus is created in its tab order.
    createDateLabels();
    createInfoUI();
    createSceneBox();
    layOut(showRelease);
    setSceneBox(false);
    updateDateTimer();
}

void InfoWidget::createDateLabels()
{
    m_date = new ToolkitLabel(this);
    m_date->setObjectName(QStringLiteral("dateTimeLabel"));
    m_date->setFixedSize(200, 20);

    m_lunarDate = new ToolkitLabel(this);
    m_lunarDate->setObjectName(QStringLiteral("CdateTimeLabel"));
    m_lunarDate->setLayoutDirection(Qt::LeftToRight);
    m_lunarDate->setFixedSize(200, 16);
}

void InfoWidget::createSceneBox()
{
    m_sceneCaption = new ToolkitLabel(QStringLiteral("场所"), this);
    m_sceneCaption->setFont(QFont(QStringLiteral("Microsoft YaHei"), 15));
    m_sceneCaption->setFixedSize(36, 36);
    m_sceneCaption->shrinkFontToWidth();

    m_sceneBox = new ToolkitComboBox(this);
    m_sceneBox->setFixedSize(229, 36);
    m_sceneBox->setAccessibleName(m_sceneCaption->text());
    m_sceneCaption->setBuddy(m_sceneBox);
    connect(m_sceneBox, &QComboBox::currentTextChanged, this, &InfoWidget::environmentChanegd);
}

void InfoWidget::createInfoUI()
{
    m_pages = new QWidget(this);
    m_pages->setFixedSize(280, 310);

    auto* loginButton = new ToolkitButtonBoxButton(shared("登录信息"));
    loginButton->setObjectName(QStringLiteral("LoginInfo"));
    loginButton->setFixedSize(128, 36);
    auto* netButton = new ToolkitButtonBoxButton(shared("网络信息"));
    netButton->setObjectName(QStringLiteral("NetInfo"));
    netButton->setFixedSize(128, 36);

    auto* buttons = new ToolkitButtonBox(m_pages);
    buttons->setButtonList({loginButton, netButton}, true);
    buttons->setFixedSize(260, 36);
    buttons->move((m_pages->width() - buttons->width()) / 2, 0);
    loginButton->setChecked(true);
    connect(buttons, &ToolkitButtonBox::buttonClicked, this, &InfoWidget::onButtonClicked);

    initLoginInfoWidget();
    initNetInfoWidget();
    m_netPage->hide();
}

void InfoWidget::initLoginInfoWidget()
{
    m_loginPage = new InfoPage({{shared("终端别名"), "hostLabel", "terminalValue"},
                                {shared("组织名称"), "nameLabel", "nameValue"},
                                {shared("人员姓名"), "macLabel", "macValue"},
                                {shared("工号"), "ipv4Label", "userRoleValue"},
                                {shared("部门"), "department", "departmentValue"},
                                {shared("登录时间"), "ipV4GatewayLabel", "loginValue"}},
                               m_pages);
    m_loginPage->move(0, kPagesTop);
    m_loginPage->setCaptionWidth(0, 76);
    m_loginPage->setValue(5, QDateTime::currentDateTime().toString(QStringLiteral("yyyy-MM-dd hh:mm:ss")),
                          InfoPage::Overflow::Clip);
}

void InfoWidget::initNetInfoWidget()
{
    m_netPage = new InfoPage({{shared("主机名"), "hostLabel", "hostValue"},
                              {shared("用户名"), "nameLabel", "nameValue"},
                              {shared("MAC"), "macLabel", "macValue"},
                              {shared("IPv4"), "ipv4Label", "ipv4Value"},
                              {shared("网关"), "ipV4GatewayLabel", "ipV4GatewayValue"},
                              {shared("DNS"), "dnsLabel", "dnsValeu"},
                              {shared("子网掩码"), "subnetmaskLabel", "subnetmaskValue"},
                              {shared("速率"), "netSpeedLabel", "netspeedValue"}},
                             m_pages);
    m_netPage->move(0, kPagesTop);
}

QHBoxLayout* InfoWidget::createBottomRow(bool showRelease)
{
    QFont font = m_baseFont;
    font.setPixelSize(12);
    QPalette linkPalette = palette();
    linkPalette.setColor(QPalette::ButtonText, QColor(0, 130, 250));
    linkPalette.setColor(QPalette::Button, QColor(0, 130, 250, 0));
    const auto createLink = [&](const QString& text, const char* name, int width) {
        auto* link = new ToolkitToolButton(this);
        link->setText(text);
        link->setObjectName(QLatin1String(name));
        link->setFont(font);
        link->setPalette(linkPalette);
        link->setFixedSize(width, 20);
        link->setTextAlignment(Qt::AlignRight);
        return link;
    };

    auto* row = new QHBoxLayout;
    row->setContentsMargins(0, 0, 0, 0);
    row->setSpacing(0);
    auto* onTop = new QCheckBox(QCoreApplication::translate("InfoWidget", "置顶显示"), this);
    onTop->setObjectName(QStringLiteral("onTop"));
    onTop->setFont(font);
    onTop->setFixedSize(80, 20);
    // The style draws the box's frame a little darker than this, and so that one sees it.
    QPalette boxPalette = palette();
    boxPalette.setColor(QPalette::Window, QColor(0xa8, 0xa8, 0xaa));
    onTop->setPalette(boxPalette);
    connect(onTop, &QCheckBox::stateChanged, this, &InfoWidget::onOntopStatechanged);
    row->addWidget(onTop, 0, Qt::AlignLeft);

    if (showRelease) {
        // Less than 79 where the row would not fit otherwise.
        row->addSpacerItem(new QSpacerItem(79, 0, QSizePolicy::Maximum, QSizePolicy::Minimum));
        ToolkitToolButton* release = createLink(QStringLiteral("解除管控"), "closeGuard", 70);
        connect(release, &QToolButton::clicked, this, &InfoWidget::removeRegionClicked);
        row->addWidget(release);
    }
    ToolkitToolButton* password = createLink(shared("修改密码"), "changePassword", 72);
    connect(password, &QToolButton::clicked, this, &InfoWidget::modifyPasswordClicked);
    row->addWidget(password, 0, Qt::AlignRight);
    return row;
}

void InfoWidget::layOut(bool showRelease)
{
    m_layout = new QVBoxLayout(this);
    m_layout->setSpacing(0);
    m_layout->setContentsMargins(10, 0, 5, 10);
    m_layout->addWidget(m_date);
    m_layout->addSpacing(10);
    m_layout->addWidget(m_lunarDate);
    m_layout->addSpacing(20);
    m_layout->addItem(new SeparatorItem(m_line));
    m_layout->addSpacing(10);
    m_layout->addWidget(m_pages);
    // The scene row comes here (kSceneRowIndex).
    m_layout->addSpacing(10);
    m_layout->addStretch();
    m_layout->addLayout(createBottomRow(showRelease));
    m_layout->addSpacing(12);
}

void InfoWidget::setLoginInfo(const TLoginInfo& info)
{
    const QStringList values = {info.terminalAlias, info.organizationName, info.personName, info.jobNumber,
                                info.department};
    for (int row = 0; row < values.size(); ++row)
        m_loginPage->setValue(row, values[row], InfoPage::Overflow::Elide);
}

void InfoWidget::setNetInfo(const TNetInfo& info)
{
    m_netPage->setValue(0, info.hostName, InfoPage::Overflow::Elide);
    m_netPage->setValue(1, info.userName, InfoPage::Overflow::Elide);
    const QStringList values = {info.mac, info.ipv4, info.gateway, info.dns, info.subnetMask, info.speed};
    for (int row = 0; row < values.size(); ++row)
        m_netPage->setValue(row + 2, values[row], InfoPage::Overflow::Clip);
}

void InfoWidget::setSceneBox(bool visible)
{
    m_sceneCaption->setVisible(visible);
    m_sceneBox->setVisible(visible);
    if (!visible) {
        resize(kPanelWidth, kPanelHeight);
        setFixedHeight(kPanelHeight);
        return;
    }
    auto* row = new QHBoxLayout;
    row->setSpacing(0);
    row->setContentsMargins(0, 0, 0, 10);
    row->addWidget(m_sceneCaption, 0, Qt::AlignLeft);
    row->addWidget(m_sceneBox, 0, Qt::AlignRight);
    row->addSpacing(kRightInset);
    m_layout->insertLayout(kSceneRowIndex, row);
    setFixedHeight(kPanelHeightWithScenes);
}

void InfoWidget::setSceneBoxData(const QStringList& names)
{
    m_sceneNames += names;
    QStringList shown;
    for (const QString& name : names)
        shown.append(zent::display::cut(name, zent::display::kSceneNameLength));
    m_sceneBox->addItems(shown);
}

void InfoWidget::setCurrentScene(int index)
{
    m_sceneBox->setCurrentIndex(index);
}

QString InfoWidget::getCurrentScene() const
{
    QString scene = m_sceneNames.value(m_sceneBox->currentIndex());
    qDebug() << "getCurrentScene" << scene;
    return scene;
}

void InfoWidget::setMessageButtonText(const QString&)
{
}

void InfoWidget::initTimer()
{
    auto* timer = new QTimer(this);
    connect(timer, &QTimer::timeout, this, &InfoWidget::updateDateTimer);
    timer->start(kDateRefreshMs);
}

void InfoWidget::initUIPos()
{
    zent::screens::placeBottomRight(*window(), zent::screens::fullGeometry());
}

void InfoWidget::onButtonClicked(QAbstractButton* button)
{
    qDebug() << "onButtonClicked";
    const bool network = button->objectName() == QLatin1String("NetInfo");
    m_loginPage->setVisible(!network);
    m_netPage->setVisible(network);
}

void InfoWidget::updateDateTimer()
{
    const QDateTime now = QDateTime::currentDateTime();
    QFont dateFont(QStringLiteral("Source Han Sans CN"));
    dateFont.setBold(true);
    dateFont.setPixelSize(17);
    m_date->setFont(dateFont);
    m_date->setText(QLocale().toString(now, QStringLiteral("yyyy年MM月dd日 dddd")));
    // The weekday's name may be longer than the line has room for in some locales.
    m_date->shrinkFontToWidth();

    QString lunarDay;
    QString year;
    QString month;
    QString day;
    QString solarTerm;
    QString festival;
    GetLunarDay(now.date(), lunarDay, year, month, day, solarTerm, festival);
    m_lunarDate->setText(year + lunarDay);
}

void InfoWidget::onOntopStatechanged(int state)
{
    QWidget* top = window();
    Qt::WindowFlags flags = Qt::Tool | Qt::FramelessWindowHint;
    if (state == Qt::Checked)
        flags |= Qt::WindowStaysOnTopHint;
    // Changing the flags hides the window.
    top->setWindowFlags(flags);
    initUIPos();
    zent::showActive(*top);
}

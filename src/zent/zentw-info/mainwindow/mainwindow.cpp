// SPDX-License-Identifier: Apache-2.0
#include "mainwindow/mainwindow.h"

#include "dbusnames.h"
#include "messages/noticedialog.h"
#include "networkdaemonproxy.h"
#include "panel/infowidget.h"
#include "password/modifydialog.h"
#include "paths.h"
#include "release/closeguarddialog.h"
#include "replies/replies.h"
#include "screen/screens.h"
#include "screen/showwindow.h"
#include "system/childprocess.h"
#include "terminal/noconfig.h"
#include "toolkitdialog.h"
#include "toolkittitlebar.h"
#include "windowmanagerhelper.h"

#include <QAbstractButton>
#include <QCheckBox>
#include <QCloseEvent>
#include <QDebug>
#include <QFile>
#include <QSignalBlocker>
#include <QTextCodec>
#include <QVBoxLayout>

#include <cstdio>
#include <cstdlib>
#include <memory>

/// The images live in a static library, whose initialiser the linker would otherwise drop. Outside any namespace, as
/// the initialiser is.
static void initResources()
{
    Q_INIT_RESOURCE(images);
}

namespace
{

/// From this version on a click on the icon toggles the message window.
constexpr int kMessageWindowVersion = 1030;

constexpr int kWindowWidth = 300;
constexpr int kTitlebarHeight = 50;
constexpr int kOpaque = 255;
constexpr int kPlacementIntervalMs = 1000;

const char* textOf(bool value)
{
    return value ? "true" : "false";
}

} // namespace

int MainWindow::unreadMessageCount = 0;

MainWindow::MainWindow(QWidget* parent, int osVersion)
    : ToolkitBlurFrame(parent), scenes(terminal, account.name(), this),
      unread(account.name(), unreadMessageCount, this), tray(osVersion, productName(), this),
      networkProxy(new NetworkDaemonProxy(zent::dbus::kNetworkService, zent::dbus::kNetworkPath,
                                          QDBusConnection::sessionBus(), this)),
      osVersion(osVersion)
{
    initResources();
    getUserName();
    createNoticeDialog();
    getConfig();
    createPanel();
    connectPieces();
    tray.showWhenHosted();
    initPlatformMessage();
    scenes.start();
    account.start();
    onNetinfoClicked();
    onLogininfoClicked();
    scenes.renewCurrentScene(zent::kStartScene);
    connect(&posTimer, &QTimer::timeout, this, &MainWindow::resetUIPos);
    posTimer.start(kPlacementIntervalMs);
    zent::screens::watch(this, [this] { returnToScreen(); });
    if (!WindowManagerHelper::instance()->hasBlurWindow())
        setMaskAlpha(kOpaque);
}

MainWindow::~MainWindow()
{
    const auto remove = [](auto*& member) {
        delete member;
        member = nullptr;
    };
    remove(modifyDialog);
    remove(noticeDialog);
    remove(messageWindow);
    remove(guardDialog);
    remove(networkProxy);
}

void MainWindow::createPanel()
{
    setFixedWidth(kWindowWidth);
    setAccessibleName(productName());
    const bool showRelease = account.isScenceUser() || account.isAdminUser();

    auto* titlebar = new ToolkitTitlebar(this);
    titlebar->setMenuVisible(false);
    titlebar->setFixedHeight(kTitlebarHeight);
    titlebar->setBackgroundTransparent(true);
    QPalette transparent = titlebar->palette();
    transparent.setColor(QPalette::Window, Qt::transparent);
    titlebar->setPalette(transparent);
    connect(titlebar, &ToolkitTitlebar::windowDragged, this, [this] { movedByUser = true; });
    setWindowFlag(Qt::WindowMinimizeButtonHint, false);
    setWindowFlag(Qt::WindowMaximizeButtonHint, false);

    infoWidget = new InfoWidget(this, showRelease);
    connectPanel();

    auto* layout = new QVBoxLayout(this);
    layout->setSpacing(0);
    layout->setContentsMargins(0, 0, 0, 0);
    layout->addWidget(titlebar);
    layout->addWidget(infoWidget);
    fitToPanel();
    infoWidget->initTimer();
}

void MainWindow::connectPanel()
{
    connect(infoWidget, SIGNAL(modifyPasswordClicked()), this, SLOT(onModifypasswordClicked()));
    connect(infoWidget, SIGNAL(removeRegionClicked()), this, SLOT(onCloseguardClicked()));
    connect(infoWidget, SIGNAL(shutdownClicked()), this, SLOT(onShutdownClicked()));
    // The panel then goes to its corner by itself.
    connect(infoWidget->findChild<QCheckBox*>(QStringLiteral("onTop")), &QCheckBox::stateChanged, this,
            [this] { movedByUser = false; });
    // Every change of page refreshes the page.
    const auto loginButton = infoWidget->findChild<QAbstractButton*>(QStringLiteral("LoginInfo"));
    const auto netButton = infoWidget->findChild<QAbstractButton*>(QStringLiteral("NetInfo"));
    connect(loginButton, &QAbstractButton::clicked, this, &MainWindow::onLogininfoClicked);
    connect(netButton, &QAbstractButton::clicked, this, &MainWindow::onNetinfoClicked);
}

void MainWindow::connectPieces()
{
    connect(&account, &Account::userChanged, this, &MainWindow::onLogininfoClicked);
    connect(&account, &Account::organisationChanged, this, [this] {
        onLogininfoClicked();
        onNetinfoClicked();
    });
    connect(&account, &Account::areaKnown, &scenes, &Scenes::getAllUserEnvironment);
    connect(&account, &Account::areaFailed, this, [this] { setSceneBox(false); });

    connect(&scenes, &Scenes::choiceChanged, this, &MainWindow::setSceneBox);
    connect(&scenes, &Scenes::namesAdded, infoWidget, &InfoWidget::setSceneBoxData);
    connect(&scenes, &Scenes::selected, this, [this](int index) {
        // Going back is not a choice either: it must not reach the user's scene file.
        const QSignalBlocker blocker(infoWidget);
        infoWidget->setCurrentScene(index);
    });
    // Filling the box is not a choice.
    connect(infoWidget, &InfoWidget::environmentChanegd, this, [this] {
        if (scenes.areOffered())
            switchUserEvn();
    });

    connect(&unread, &UnreadPoll::newMessage, this, &MainWindow::newMessage);
    connect(&unread, &UnreadPoll::textChanged, infoWidget, &InfoWidget::setMessageButtonText);
    connect(this, &MainWindow::startgetMeInfo, &account, &Account::getusrInfo);

    connect(&tray, &TrayIcon::activated, this, &MainWindow::onActivatedSysTrayIcon);
    connect(&tray, &TrayIcon::balloonClicked, this, &MainWindow::openNotice);
}

void MainWindow::setSceneBox(bool visible)
{
    infoWidget->setSceneBox(visible);
    fitToPanel();
}

void MainWindow::fitToPanel()
{
    const int height = kTitlebarHeight + infoWidget->height();
    if (height == this->height())
        return;
    setFixedHeight(height);
    if (!movedByUser)
        zent::screens::placeBottomRight(*this, zent::screens::availableGeometry());
}

void MainWindow::returnToScreen()
{
    const QList<QRect> screens = zent::screens::all();
    if (!zent::screens::showWhole(screens, noticeDialog->frameGeometry()))
        zent::screens::placeCentre(*noticeDialog);
    if (movedByUser && zent::screens::showWhole(screens, frameGeometry()))
        return;
    movedByUser = false;
    zent::screens::placeBottomRight(*this, zent::screens::availableGeometry());
}

void MainWindow::getUserName()
{
    if (account.getUserName())
        scenes.startWithFirst();
    else
        closewindow();
}

bool MainWindow::whetherJoinGuard()
{
    return !zent::Terminal::missingInfoFile();
}

void MainWindow::getConfig()
{
    if (const auto missing = zent::Terminal::missingInfoFile()) {
        ToolkitDialog::tell(nullptr, zent::noconfig::text(zent::kUserinfoPath, missing->text), zent::noconfig::kTitle,
                            ToolkitDialog::CriticalBox);
        std::_Exit(-1);
    }
    terminal.read();
}

void MainWindow::switchUserEvn()
{
    scenes.switchUserEvn(infoWidget->getCurrentScene());
}

void MainWindow::closeEvent(QCloseEvent*)
{
    qDebug() << "closeEvent --------";
    onHideClicked();
}

void MainWindow::onActivatedSysTrayIcon(QSystemTrayIcon::ActivationReason reason)
{
    qDebug() << "onActivatedSysTrayIcon reason :" << static_cast<int>(reason);
    switch (reason) {
    case QSystemTrayIcon::Context:
        // The next left click shows the panel, whether it is visible or not.
        winstatus = 1;
        break;
    case QSystemTrayIcon::Trigger:
        qDebug() << "tarn ishidden : " << textOf(isHidden());
        qDebug() << "tarn this->openMessagetWindow : " << textOf(openMessagetWindow);
        dealSysTrayEvent();
        break;
    case QSystemTrayIcon::DoubleClick:
    case QSystemTrayIcon::MiddleClick:
    case QSystemTrayIcon::Unknown:
        break;
    }
}

void MainWindow::dealSysTrayEvent()
{
    if (osVersion >= kMessageWindowVersion) {
        const bool shown = !openMessagetWindow || (messageWindow && messageWindow->isHidden());
        if (!openMessagetWindow)
            qDebug() << "tarn this->openMessagetWindow @@@@: " << textOf(openMessagetWindow);
        if (messageWindow)
            messageWindow->setVisible(shown);
        return;
    }
    qDebug() << "winstatus : " << winstatus;
    if (winstatus == 0) {
        onHideClicked();
        return;
    }
    if (!movedByUser)
        zent::screens::keepInWorkArea(*this);
    zent::showActive(*this);
    repaint();
    winstatus = 0;
    setFocus(Qt::OtherFocusReason);
}

void MainWindow::onHideClicked()
{
    hide();
    winstatus = 1;
}

void MainWindow::onShutdownClicked()
{
    zent::startDetached(QStringLiteral("oxa-shutdown"));
}

void MainWindow::shutdown()
{
    tray.hide();
    close();
}

void MainWindow::closewindow()
{
    zent::startDetached(QStringLiteral("killall -9  tarn"));
}

void MainWindow::loadSelf()
{
    std::_Exit(0);
}

void MainWindow::resetUIPos()
{
    qDebug() << "resetUIPos :---------";
    const QRect full = zent::screens::fullGeometry();
    const QRect available = zent::screens::availableGeometry();
    qDebug() << "resetUIPos :---------" << available.height() << ":" << full.height();
    if (full.height() > available.height()) {
        qDebug() << "resetUIPos :---@@@@";
        posTimer.stop();
        movedByUser = false;
        zent::screens::placeBottomRight(*this, available);
    }
    if (!isVisible())
        posTimer.stop();
}

int MainWindow::system(const QString& command)
{
    constexpr int kEmptyCommand = -1;
    constexpr int kNotOpened = -2;
    constexpr int kNotClosed = -3;
    if (command.isEmpty())
        return kEmptyCommand;
    FILE* pipe = popen(command.toUtf8().constData(), "r");
    if (!pipe)
        return kNotOpened;
    char piece[128];
    // One for the whole output: a character that a piece's end cuts appears in the next piece.
    const std::unique_ptr<QTextDecoder> decoder(QTextCodec::codecForName("UTF-8")->makeDecoder());
    while (fgets(piece, sizeof piece, pipe)) {
        const QString line = decoder->toUnicode(piece);
        qDebug() << "system" << line;
        commandOutput.append(line);
    }
    if (decoder->needsMoreData())
        commandOutput.last() += QChar(QChar::ReplacementCharacter);
    return pclose(pipe) == -1 ? kNotClosed : 0;
}

QString MainWindow::readScriptsFile(const QString& path)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        qDebug() << "readScriptsFile read file path failed! " << path;
        return QString();
    }
    return QString::fromUtf8(file.readAll());
}

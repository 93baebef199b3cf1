#include "mainwindow.h"

#include "closeguarddialog.h"
#include "dbusnames.h"
#include "httprequest.h"
#include "idcommand.h"
#include "infowidget.h"
#include "legacyqt.h"
#include "loginname.h"
#include "modifydialog.h"
#include "networkdaemonproxy.h"
#include "noticedialog.h"
#include "notification.h"
#include "replies.h"
#include "screens.h"
#include "toolkittitlebar.h"
#include "trayhost.h"
#include "windowmanagerhelper.h"

#include <QAbstractButton>
#include <QCloseEvent>
#include <QDebug>
#include <QNetworkAccessManager>
#include <QNetworkReply>
#include <QTime>
#include <QTimer>
#include <QVBoxLayout>

#include <cstdio>
#include <cstdlib>
#include <unistd.h>

/// The images live in a static library, whose initialiser the linker would otherwise drop. Outside any namespace, as
/// the initialiser is.
static void initResources()
{
    Q_INIT_RESOURCE(images);
}

namespace
{

constexpr int kWindowWidth = 300;
constexpr int kTitlebarHeight = 50;
constexpr int kOpaque = 255;
constexpr int kUserInfoIntervalMs = 2000;
constexpr int kAreaInfoIntervalMs = 3000;
constexpr int kPlacementIntervalMs = 1000;
constexpr int kPolicyEarliestMs = 30000;
constexpr int kPolicyLatestMs = 60000;

} // namespace

MainWindow::MainWindow(QWidget* parent, int osVersion)
    : ToolkitBlurFrame(parent),
      networkProxy(new NetworkDaemonProxy(zent::dbus::kNetworkService, zent::dbus::kNetworkPath,
                                          QDBusConnection::sessionBus(), this)),
      osVersion(osVersion), startedId(std::make_unique<IdCommand>())
{
    initResources();
    policyTimer = std::make_unique<QTimer>();
    connect(policyTimer.get(), &QTimer::timeout, this, &MainWindow::startPolicy);
    policyTimer->start(generateRandnum(kPolicyLatestMs, kPolicyEarliestMs));
    getUserName();
    createNoticeDialog();
    getConfig();
    createPanel();
    // An icon made before the desktop's tray host has registered would never appear there, so until then it waits.
    if (zent::trayhost::canShowIconNow())
        showSystemTrayIcon();
    initPlatformMessage();
    createManagers();
    connectManagementClient();
    startInfoTimers();
    onNetinfoClicked();
    onLogininfoClicked();
    renewCurrentScene(zent::kStartScene);
    posTimer = std::make_unique<QTimer>();
    connect(posTimer.get(), &QTimer::timeout, this, &MainWindow::resetUIPos);
    posTimer->start(kPlacementIntervalMs);
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
    remove(userManager);
    remove(areaInfoTimer);
    remove(userInfoTimer);
}

void MainWindow::createPanel()
{
    setFixedWidth(kWindowWidth);
    setAccessibleName(productName());
    const bool showRelease = isScenceUser() || isAdminUser();

    titlebar = new ToolkitTitlebar(this);
    titlebar->setMenuVisible(false);
    titlebar->setFixedHeight(kTitlebarHeight);
    titlebar->setBackgroundTransparent(true);
    QPalette transparent = titlebar->palette();
    transparent.setColor(QPalette::Window, Qt::transparent);
    titlebar->setPalette(transparent);
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
    connect(titlebar, &ToolkitTitlebar::windowDragged, this, [this] { movedByUser = true; });
    // Every change of page refreshes the page.
    const auto loginButton = infoWidget->findChild<QAbstractButton*>(QStringLiteral("LoginInfo"));
    const auto netButton = infoWidget->findChild<QAbstractButton*>(QStringLiteral("NetInfo"));
    connect(loginButton, &QAbstractButton::clicked, this, &MainWindow::onLogininfoClicked);
    connect(netButton, &QAbstractButton::clicked, this, &MainWindow::onNetinfoClicked);
}

void MainWindow::fitToPanel()
{
    const int height = titlebar->height() + infoWidget->height();
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

void MainWindow::createNoticeDialog()
{
    if (!QNotification::qInstance)
        QNotification::qInstance = new QNotification;
    noticeDialog = new NoticeDialog(userName, this);
    noticeDialog->setWindowFlags(noticeDialog->windowFlags() | Qt::WindowStaysOnTopHint);
}

void MainWindow::createManagers()
{
    userManager = new QNetworkAccessManager(this);
    areaManager = new QNetworkAccessManager(this);
    sceneManager = new QNetworkAccessManager(this);
    connect(userManager, &QNetworkAccessManager::finished, this, &MainWindow::analysejson);
    connect(areaManager, &QNetworkAccessManager::finished, this, &MainWindow::rcvAreainfoData);
    connect(sceneManager, &QNetworkAccessManager::finished, this, &MainWindow::rcvEvninfoData);
}

void MainWindow::connectManagementClient()
{
    const HttpRequest* client = HttpRequest::GetInstance();
    connect(client, &HttpRequest::sigUserInfo, this, &MainWindow::onUserInfo);
    connect(client, &HttpRequest::sigCompanyName, this, &MainWindow::onCompanyName);
}

void MainWindow::startInfoTimers()
{
    userInfoTimer = new QTimer;
    connect(userInfoTimer, &QTimer::timeout, this, &MainWindow::getusrInfo);
    userInfoTimer->start(kUserInfoIntervalMs);
    areaInfoTimer = new QTimer;
    connect(areaInfoTimer, &QTimer::timeout, this, &MainWindow::getAreaInfo);
    areaInfoTimer->start(kAreaInfoIntervalMs);
}

void MainWindow::closeEvent(QCloseEvent*)
{
    qDebug() << "closeEvent"
             << "--------";
    onHideClicked();
}

void MainWindow::onHideClicked()
{
    hide();
    winstatus = 1;
}

void MainWindow::onShutdownClicked()
{
    zent::legacy::startDetached(QStringLiteral("oxa-shutdown"));
}

void MainWindow::shutdown()
{
    if (sysTrayIcon)
        sysTrayIcon->setVisible(false);
    close();
}

void MainWindow::closewindow()
{
    zent::legacy::startDetached(QStringLiteral("killall -9  tarn"));
}

void MainWindow::loadSelf()
{
    std::_Exit(0);
}

void MainWindow::onOntopStatechanged()
{
    // The panel changes the flags itself.
}

void MainWindow::resetUIPos()
{
    qDebug() << "resetUIPos"
             << ":---------";
    const QRect full = zent::screens::fullGeometry();
    const QRect available = zent::screens::primaryAvailableGeometry();
    qDebug() << "resetUIPos"
             << ":---------" << available.height() << ":" << full.height();
    if (full.height() > available.height()) {
        qDebug() << "resetUIPos"
                 << ":---@@@@";
        posTimer->stop();
        zent::screens::placeBottomRight(*this, available);
    }
    if (!isVisible())
        posTimer->stop();
}

int MainWindow::generateRandnum(const int& a, const int& b)
{
    zent::legacy::seedRandom(static_cast<unsigned int>(QTime(0, 0).secsTo(QTime::currentTime())));
    const int r = zent::legacy::random();
    return a == b ? b : r % (a - b) + b;
}

QString MainWindow::getHostName()
{
    char name[1024] = {};
    gethostname(name, sizeof name - 1);
    return QString::fromLatin1(name);
}

void MainWindow::getUserName()
{
    const QString name = sessionLoginName().remove(QLatin1Char('@'));
    qDebug() << "getusername:" << name;
    if (isLdapUser()) {
        currentSceneIndex = 0;
        userName = name;
        qDebug() << "userName:" << userName;
    } else {
        closewindow();
    }
    qDebug() << "username got :" << userName;
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
    while (fgets(piece, sizeof piece, pipe)) {
        const QString line = QString::fromUtf8(piece);
        qDebug() << "system" << line;
        commandOutput.append(line);
    }
    return pclose(pipe) == -1 ? kNotClosed : 0;
}

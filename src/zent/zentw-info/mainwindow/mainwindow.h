#pragma once

#include "toolkitblurframe.h"
#include "trayclicks.h"

#include <QList>
#include <QPair>
#include <QString>
#include <QSystemTrayIcon>

#include <functional>
#include <memory>

class IdCommand;
class InfoWidget;
class ModifyDialog;
class NetworkDaemonProxy;
class NoticeDialog;
class QNetworkAccessManager;
class QNetworkReply;
class QTimer;
class ToolkitTitlebar;
class closeGuarddialog;

namespace zent
{
struct UserData;
}

/// The client's switchboard: the panel that a click on the tray icon opens, the timers that fetch what it shows, and
/// the way from its buttons to the dialogs. Lives as long as the process.
class MainWindow : public ToolkitBlurFrame
{
    Q_OBJECT

public:
    /// Builds everything and starts the timers. Below version 1030 the tray icon is fixed and toggles this window.
    /// Ends the process when the terminal info file is missing.
    MainWindow(QWidget* parent, int osVersion);
    ~MainWindow() override;

    /// The last known number of unread messages, for the whole process.
    static int unreadMessageCount;

    /// Makes the tray icon. Called once, when a tray host is known to be there.
    void showSystemTrayIcon();
    /// Whether the tray icon has been made.
    bool hasSystemTrayIcon() const { return sysTrayIcon != nullptr; }

    /// Shows a message beside the tray icon; a click on it opens the notice dialog. False without an icon.
    bool showTrayBalloon(const QString& title, const QString& text);

    /// A random integer in [b, a); b when both are equal. Seeded with the seconds since midnight, so that calls within
    /// one second give the same number.
    int generateRandnum(const int& a, const int& b);

    /// The machine's host name.
    QString getHostName();

    /// Runs a shell command, waits for the end of its output and appends its lines, in pieces of at most 127 bytes, to
    /// the collected output. 0 on success, −1 for an empty command, −2 or −3 when the pipe cannot be opened or closed;
    /// the command's own exit status is not returned.
    int system(const QString& command);
    /// Everything that system() has collected so far.
    QList<QString> commandOutputLines() const { return commandOutput; }

    /// Whether the user works under a scene's name.
    bool isScenceUser();
    /// Whether "id" shows an administrator of the platform.
    bool isAdminUser();
    /// Whether the user comes from the directory; always, in this version.
    bool isLdapUser();

    /// Reads a user reply's body; 1 when it was good, else 0.
    int analyseData(QByteArray* body);
    /// Reads an area reply's body; 1 when it was JSON, else 0.
    int analyseAreaData(QByteArray* body);
    /// Reads a scene reply's body; 1 when it was JSON, else 0.
    int analyseEvnData(QByteArray* body);

    /// Whether this terminal has a terminal info file; its absence is logged.
    bool whetherJoinGuard();
    /// Asks the server for the scenes of this user on this terminal.
    void getAllUserEnvironment();
    /// Index of the first scene called `name`, −1 when there is none.
    int getEvncode(const QString& name);
    /// Records the code of the scene the user works in; a file that cannot be written is skipped.
    void renewCurrentScene(const QString& scene);
    /// Asks for the number of unread messages once, without announcing it.
    void initUnreadMessageCount();
    /// Takes one message off the count and off the panel's text.
    void readOneUnreadMessage();

    /// Starts policy loading for a scene; this version has no command to run.
    void callloadpolicy(const int& kind, const QString& scene);
    /// A file's whole content as UTF-8 text; empty, with a log line, when it cannot be opened.
    QString readScriptsFile(const QString& path);

public slots:
    void onActivatedSysTrayIcon(QSystemTrayIcon::ActivationReason reason);
    void dealSysTrayEvent();
    /// Gives the tray icon the form for a colour type of ThemeHelper.
    void setSysThemetype(int colorType);
    void onHideClicked();
    /// Opens the desktop's shutdown dialog.
    void onShutdownClicked();
    /// Takes the client off the screen: no tray icon, no window.
    void shutdown();
    /// Ends this program's processes; for users that are not of the directory.
    void closewindow();
    /// Ends the process at once, without clean-up.
    void loadSelf();
    void onOntopStatechanged();
    /// Opens the administrator's release dialog.
    void onCloseguardClicked();
    /// Opens the password dialog.
    void onModifypasswordClicked();
    void onLogininfoClicked();
    void onNetinfoClicked();
    void toLogininfo();
    void toNetinfo();
    /// Fills the current page from the network daemon's answer and from what the server said.
    void updateNetInfo();
    void resetUIPos();

    void getusrInfo();
    void onUserInfo(const int& statusCode, const QString& data);
    void getAreaInfo();
    void onCompanyName(const int& statusCode, const QString& data);
    void analysejson(QNetworkReply* reply);
    void rcvAreainfoData(QNetworkReply* reply);

    void rcvEvninfoData(QNetworkReply* reply);
    /// Makes the scene chosen in the panel the current one.
    void switchUserEvn();
    /// Puts the panel's scene box back on the current scene.
    void reverseEvn();
    /// Loads the policy of the scene that every session starts in.
    void startPolicy();

    /// Asks for the number of unread messages, announces a change, and sets the time of the next poll.
    void unreadMessages();
    /// One message was read elsewhere.
    void onReadListMessage(const QString& uuid);
    /// All messages were read elsewhere.
    void onReadAllMessage();
    void onCloseMessageWinDow();
    void onNoticeReadbuttonClicked();
    void onNoticeNextbuttonClicked();
    /// Opens the notice dialog on the newest unread message, if there is one.
    void openNotice();

signals:
    void sizeChanged();
    void newMessage();
    void readNotify(QString uuid);
    /// Asks for a refresh of the user data.
    void startgetMeInfo();
    /// The scenes were asked for and did not come.
    void scenesNotKnown();

protected:
    void closeEvent(QCloseEvent* event) override;
    // The panel's surface takes no part in dragging; the title bar does.
    void mousePressEvent(QMouseEvent*) override {}
    void mouseMoveEvent(QMouseEvent*) override {}
    void mouseReleaseEvent(QMouseEvent*) override {}

private:
    void createPanel();
    void connectPanel();
    void createNoticeDialog();
    void initPlatformMessage();
    void askUnread(const std::function<void(int total)>& counted);
    void refreshOpenNotice();
    void createManagers();
    void connectManagementClient();
    void startInfoTimers();
    void toggleMessageWindow();
    void getUserName();
    void getConfig();
    void storeUserData(const zent::UserData& data);
    void offerScenes(const QStringList& names);
    /// Follows a change of the panel's height; the window keeps its corner unless the user has moved it.
    void fitToPanel();
    /// Puts the panel into its corner again after the screens have changed, unless the user has moved it to a place
    /// that is still on a screen.
    void returnToScreen();
    /// What the tray icon and the panel are called.
    static QString productName() { return tr("终端域管平台"); }

    QList<QString> commandOutput;
    QNetworkAccessManager* userManager = nullptr;
    QNetworkAccessManager* areaManager = nullptr;
    QNetworkAccessManager* sceneManager = nullptr;
    QList<QPair<QString, QString>> sceneList;
    bool openMessagetWindow = false;
    QString userName;
    ModifyDialog* modifyDialog = nullptr;
    NoticeDialog* noticeDialog = nullptr;
    QWidget* messageWindow = nullptr;
    QTimer* userInfoTimer = nullptr;
    QTimer* areaInfoTimer = nullptr;
    std::unique_ptr<QTimer> unreadTimer;
    std::unique_ptr<QTimer> policyTimer;
    std::unique_ptr<QTimer> posTimer;
    closeGuarddialog* guardDialog = nullptr;
    NetworkDaemonProxy* networkProxy = nullptr;
    QSystemTrayIcon* sysTrayIcon = nullptr;
    TrayClicks trayClicks;
    int infoPage = 0;

    QString clientName;
    QString organizationName;
    QString gecosName;
    QString gecosLast;
    QString groupName;
    int userId = 0;

    QString serverHost;
    QString serverPort;
    QString isDomain;
    QString machineId;
    QString hostName;

    int winstatus = 0;
    int sceneState = 2;
    int currentSceneIndex = 0;
    bool sceneBoxReady = false;
    QString scenceUserName;
    int osVersion;
    /// The run of "id" that isAdminUser() waits for first, under way while the window is made.
    std::unique_ptr<IdCommand> startedId;
    ToolkitTitlebar* titlebar = nullptr;
    InfoWidget* infoWidget = nullptr;
    bool movedByUser = false;
};

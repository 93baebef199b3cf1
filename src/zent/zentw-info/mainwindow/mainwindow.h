// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "account/account.h"
#include "messages/unreadpoll.h"
#include "scenes/scenes.h"
#include "terminal/terminal.h"
#include "toolkitblurframe.h"
#include "tray/trayicon.h"

#include <QList>
#include <QString>
#include <QTimer>

#include <array>

class InfoWidget;
class ModifyDialog;
class NetworkDaemonProxy;
class NoticeDialog;
class closeGuarddialog;

/// The client's switchboard, and the panel that a click on the tray icon opens. It connects the panel's pages and
/// links, the dialogs, and the pieces that fetch what they show. Lives as long as the process.
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

    /// Shows a message beside the tray icon; a click on it opens the notice dialog. False without an icon, and in a
    /// tray that shows no balloons of its own.
    bool showTrayBalloon(const QString& title, const QString& text) { return tray.showBalloon(title, text); }
    /// Takes the session user's name; ends the client's processes when the user is not of the directory.
    void getUserName();
    /// Reads the server's address and the machine identifier. Ends the process when the terminal info file is missing.
    void getConfig();
    /// Starts the unread poll and connects the notice dialog's buttons.
    void initPlatformMessage();
    /// Asks the server for the scenes of this user on this terminal.
    void getAllUserEnvironment() { scenes.getAllUserEnvironment(); }

public slots:
    void onActivatedSysTrayIcon(QSystemTrayIcon::ActivationReason reason);
    void dealSysTrayEvent();
    void onHideClicked();
    /// Opens the desktop's shutdown dialog.
    void onShutdownClicked();
    /// Takes the client off the screen: no tray icon, now or later, and no window.
    void shutdown();
    /// Ends this program's processes; for users that are not of the directory.
    void closewindow();
    void resetUIPos();
    /// Opens the administrator's release dialog.
    void onCloseguardClicked();
    /// Opens the password dialog.
    void onModifypasswordClicked();
    void onLogininfoClicked();
    void onNetinfoClicked();
    void toLogininfo() { updateNetInfo(); }
    void toNetinfo() { updateNetInfo(); }
    /// Fills the current page from the network daemon's answer and from what the server said.
    void updateNetInfo();
    /// Makes the scene chosen in the panel the current one.
    void switchUserEvn();
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

protected:
    void closeEvent(QCloseEvent* event) override;
    void showEvent(QShowEvent* event) override;
    // The panel's surface takes no part in dragging; the title bar does.
    void mousePressEvent(QMouseEvent*) override {}
    void mouseMoveEvent(QMouseEvent*) override {}
    void mouseReleaseEvent(QMouseEvent*) override {}

private:
    enum Page { kLoginPage, kNetworkPage };

    void createPanel();
    void connectPanel();
    void connectPieces();
    void createNoticeDialog();
    void refreshOpenNotice();
    void setSceneBox(bool visible);
    void fillDuePages();
    /// Follows a change of the panel's height; the window keeps its corner unless the user has moved it.
    void fitToPanel();
    /// Puts the panel back into its corner after a change of screens, unless the user's place for it is still on one.
    void returnToScreen();
    /// What the tray icon and the panel are called.
    static QString productName() { return tr("终端域管平台"); }

    zent::Terminal terminal;
    Account account;
    Scenes scenes;
    UnreadPoll unread;
    TrayIcon tray;
    QList<QString> commandOutput;
    bool openMessagetWindow = false;
    ModifyDialog* modifyDialog = nullptr;
    NoticeDialog* noticeDialog = nullptr;
    QWidget* messageWindow = nullptr;
    closeGuarddialog* guardDialog = nullptr;
    QTimer posTimer{this};
    NetworkDaemonProxy* networkProxy;
    Page infoPage = kLoginPage;
    /// By page: it was to be filled, and the network daemon has given no good answer since.
    std::array<bool, 2> pageIsDue{};
    int winstatus = 0;
    int osVersion;
    InfoWidget* infoWidget = nullptr;
    bool movedByUser = false;

    // Agreed with other components, and called by them only.
public:
    void showSystemTrayIcon() { tray.show(); }
    /// A random integer in [b, a); b when both are equal. Calls within one second give the same number.
    int generateRandnum(const int& a, const int& b) { return zent::generateRandnum(a, b); }
    QString getHostName() { return zent::localHostName(); }
    /// Runs a shell command to its end and collects its output's lines, in pieces of at most 127 bytes. −1 for an empty
    /// command, −2 or −3 when the pipe cannot be opened or closed, else 0, whatever the command's own status.
    int system(const QString& command);
    QList<QString> commandOutputLines() const { return commandOutput; }
    bool isScenceUser() { return account.isScenceUser(); }
    bool isAdminUser() { return account.isAdminUser(); }
    bool isLdapUser() { return Account::isLdapUser(); }
    int analyseData(QByteArray* body) { return account.analyseData(body); }
    int analyseAreaData(QByteArray* body) { return account.analyseAreaData(body); }
    int analyseEvnData(QByteArray* body) { return scenes.analyseEvnData(body); }
    bool whetherJoinGuard();
    int getEvncode(const QString& name) { return scenes.getEvncode(name); }
    void renewCurrentScene(const QString& scene) { scenes.renewCurrentScene(scene); }
    void callloadpolicy(const int& kind, const QString& scene) { scenes.callloadpolicy(kind, scene); }
    /// A file's whole content as UTF-8 text; empty, with a log line, when it cannot be opened.
    QString readScriptsFile(const QString& path);
    void initUnreadMessageCount() { unread.initUnreadMessageCount(); }
    void readOneUnreadMessage() { unread.readOneUnreadMessage(); }
public slots:
    void setSysThemetype(int colorType) { tray.setSysThemetype(colorType); }
    /// Ends the process at once, without clean-up.
    void loadSelf();
    void onOntopStatechanged() {}
    void getusrInfo() { account.getusrInfo(); }
    void onUserInfo(const int& statusCode, const QString& data) { account.onUserInfo(statusCode, data); }
    void getAreaInfo() { account.getAreaInfo(); }
    void onCompanyName(const int& statusCode, const QString& data) { account.onCompanyName(statusCode, data); }
    void analysejson(QNetworkReply* reply) { account.analysejson(reply); }
    void rcvAreainfoData(QNetworkReply* reply) { account.rcvAreainfoData(reply); }
    void rcvEvninfoData(QNetworkReply* reply) { scenes.rcvEvninfoData(reply); }
    void reverseEvn() { scenes.reverseEvn(); }
    void startPolicy() { scenes.startPolicy(); }
    void unreadMessages() { unread.unreadMessages(); }
    /// One message was read elsewhere, or all were.
    void onReadListMessage(const QString& uuid);
    void onReadAllMessage();
    void onCloseMessageWinDow() { openMessagetWindow = false; }
};

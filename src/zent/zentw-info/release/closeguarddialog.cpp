// SPDX-License-Identifier: Apache-2.0
#include "release/closeguarddialog.h"

#include "busproxy.h"
#include "dbusnames.h"
#include "displaytext.h"
#include "fileconfig.h"
#include "httprequest.h"
#include "httprules.h"
#include "libzentoxa.h"
#include "paths.h"
#include "release/releasereply.h"
#include "release/schemapath.h"
#include "release/spinerwin.h"
#include "screen/screens.h"
#include "screen/showwindow.h"
#include "system/childprocess.h"
#include "terminalinfo.h"
#include "toolkitframe.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitpushbutton.h"
#include "toolkitwarningbutton.h"

#include <QDBusError>
#include <QDBusPendingCallWatcher>
#include <QDBusPendingReply>
#include <QDebug>
#include <QGSettings>
#include <QHBoxLayout>
#include <QIcon>
#include <QSettings>
#include <QVBoxLayout>

namespace
{

const QByteArray kControlCenterSchema = QByteArrayLiteral("com.vantor.oxa.control-center");
/// The agreed path, for a schema that has none of its own.
const QByteArray kControlCenterPath = QByteArrayLiteral("/com/vantor/oxa/control-center/");

} // namespace

closeGuarddialog::closeGuarddialog(QWidget* parent) : ToolkitDialog(parent)
{
    setIcon(QIcon(QStringLiteral(":/images/title.svg")));
    setAccessibleName(tr("解除管控"));
    setFixedSize(400, 200);
    createContent();
    connect(HttpRequest::GetInstance(), &HttpRequest::sigRemoveStatus, this, &closeGuarddialog::onRemoveDomainStatus);
    getMachineId();
    m_spinner = new spinerWin(this);
    m_domainAgent = new BusProxy(zent::dbus::kDomainAgentService, zent::dbus::kDomainAgentPath,
                                 zent::dbus::kDomainAgentService, QDBusConnection::systemBus(), this);
}

void closeGuarddialog::createContent()
{
    auto* content = new QWidget(this);
    content->setObjectName(QStringLiteral("widget"));
    content->setFixedSize(380, 140);
    auto* label = new ToolkitLabel(tr("请输入管理员密码解除管控"), content);
    m_password = new ToolkitPasswordEdit(content);
    m_password->setObjectName(QStringLiteral("password"));
    m_password->setFixedSize(360, 40);
    m_password->setEchoMode(QLineEdit::Password);
    m_password->setPlaceholderText(tr("请输入管理员密码"));
    m_password->setAccessibleName(label->text());
    // It is the administrator's password, typed at a user's terminal.
    m_password->setEchoButtonVisible(false);

    auto* close = new ToolkitPushButton(tr(" 关闭 "), content);
    close->setObjectName(QStringLiteral("close"));
    close->setFixedWidth(170);
    auto* line = new ToolkitFrame(content);
    line->setObjectName(QStringLiteral("line"));
    line->setFrameShape(QFrame::VLine);
    line->setFixedSize(1, 28);
    auto* release = new ToolkitWarningButton(tr("解除管控"), content);
    release->setObjectName(QStringLiteral("closeGuard"));
    release->setFixedWidth(170);
    release->setDefault(true);

    auto* buttons = new QHBoxLayout;
    buttons->setObjectName(QStringLiteral("buttonlayout"));
    buttons->addWidget(close);
    buttons->addWidget(line);
    buttons->addWidget(release);
    auto* layout = new QVBoxLayout(content);
    layout->setObjectName(QStringLiteral("vlayout"));
    layout->setSpacing(10);
    layout->setContentsMargins(10, 0, 10, 10);
    layout->addWidget(label);
    layout->addWidget(m_password);
    layout->addStretch();
    layout->addLayout(buttons);
    addContent(content, Qt::AlignCenter);

    connect(close, &QPushButton::clicked, this, &closeGuarddialog::onCloseClicked);
    connect(release, &QPushButton::clicked, this, &closeGuarddialog::onCloseguardClicked);
}

void closeGuarddialog::setUsrname(const QString& name)
{
    m_username = name;
    qDebug() << "closeguard get username :" << name;
}

void closeGuarddialog::setScencelist(const int& count)
{
    m_sceneCount = count;
}

void closeGuarddialog::setAreaid(const int& id)
{
    m_areaId = id;
}

void closeGuarddialog::setIpport(const QString& address)
{
    m_address = address;
}

void closeGuarddialog::getMachineId()
{
    const zent::base::FileReading file = zent::base::readMachineId();
    if (!file.exists)
        qDebug() << "no machine.txt to use";
    else if (file.opened)
        m_machineId = QString::fromUtf8(file.content).remove(QLatin1Char('\n'));
}

void closeGuarddialog::onCloseClicked()
{
    accept();
}

void closeGuarddialog::hideEvent(QHideEvent* event)
{
    m_password->clear();
    ToolkitDialog::hideEvent(event);
}

void closeGuarddialog::closeallfather()
{
    emit closeall();
}

void closeGuarddialog::onCloseguardClicked()
{
    HttpRequest::GetInstance()->postRemoveStatus(m_username, m_password->text());
}

void closeGuarddialog::onRemoveDomainStatus(int status, const QString& body)
{
    // The request has blocked the dialog. What was pressed meanwhile is lost, since the modal window that follows, a
    // message or the spinner, takes the dialog's input. The dialog may go away while a message is on the screen.
    const QPointer<ToolkitPasswordEdit> password = m_password;
    const auto refuse = [this, &password](const QString& text) {
        showMessageBox(text);
        if (password)
            password->clear();
    };
    if (status != zent::http::kOk) {
        const QString text = QStringLiteral("网络异常，请稍后重试");
        qInfo() << text;
        return refuse(text);
    }
    const zent::ReleaseReply reply = zent::parseReleaseReply(body.toUtf8());
    if (reply.state == zent::ReleaseReply::State::NotJson)
        return showMessageBox(QString());
    if (reply.state == zent::ReleaseReply::State::Refused) {
        qInfo() << "提示“管理员帐号或密码错误”“确定”:";
        return refuse(reply.message);
    }
    startSpinner();
    forbidEasyLogins();
    FileConfig::GetInstance()->setIsDomain(false);
    FileConfig::GetInstance()->writeServerConfig();
    liftLockDown();
    stopUserServices();
    leaveDomain();
}

void closeGuarddialog::startSpinner()
{
    m_spinner->setScencelist(m_sceneCount);
    m_spinner->setUsrname(m_username);
    m_spinner->setPassword(m_password->text());
    m_password->clear();
    zent::screens::placeCentre(*m_spinner);
    zent::showActive(*m_spinner);
    m_spinner->nextCliked();
}

void closeGuarddialog::forbidEasyLogins()
{
    if (!QGSettings::isSchemaInstalled(kControlCenterSchema)) {
        qWarning() << "closeGuarddialog no schema" << kControlCenterSchema;
        return;
    }
    const QByteArray ownPath = zent::schemaPath(kControlCenterSchema);
    QGSettings settings(kControlCenterSchema, ownPath.isEmpty() ? kControlCenterPath : ownPath);
    const QStringList keys = settings.keys();
    // False although the release loosens other restrictions; this is agreed and stays.
    for (const QString& key : {QStringLiteral("autoLoginVisable"), QStringLiteral("nopasswdLoginVisable")}) {
        if (keys.contains(key))
            settings.set(key, false);
    }
}

void closeGuarddialog::liftLockDown()
{
    QSettings backup(zent::kBackupConfigPath, QSettings::IniFormat);
    backup.beginGroup(QStringLiteral("config"));
    const QStringList modules = backup.value(QStringLiteral("ControlCenterList")).toStringList();
    backup.endGroup();
    Libzentoxa lockDown;
    lockDown.SetControlConfig(modules, {QString()});
    lockDown.SetHotspotEnable(1);
    lockDown.SetShortcutKeyEnable(true);
    lockDown.SetLauncherDisplayable(true);
    lockDown.SetTaskbarRightclickMenuEnable(true);
    lockDown.SetResidentTaskbarAppDisplayable(true);
    lockDown.SetRecycleBinDisplayable(true);
    lockDown.SetWebTrayIconClickable(true);
    lockDown.SetUsbTrayIconClickable(true);
}

void closeGuarddialog::stopUserServices()
{
    for (const char* command : {"systemctl --global stop zents", "systemctl --global disable zents",
                                "systemctl --global stop tarn", "systemctl --global disable tarn"})
        zent::startDetached(QLatin1String(command));
}

void closeGuarddialog::leaveDomain()
{
    const QDBusPendingCall call = m_domainAgent->asyncCall(QStringLiteral("onDomainConfig"), QStringLiteral("remove"));
    auto* watcher = new QDBusPendingCallWatcher(call, this);
    connect(watcher, &QDBusPendingCallWatcher::finished, this, &closeGuarddialog::onRemoveDomainFinished);
}

void closeGuarddialog::onRemoveDomainFinished(QDBusPendingCallWatcher* watcher)
{
    watcher->deleteLater();
    const QDBusPendingReply<int> reply = *watcher;
    if (reply.isError()) {
        const QString text = QStringLiteral("退域执行失败!");
        qCritical() << text;
        return showMessageBox(text);
    }
    BusProxy identity(zent::dbus::kIdentityService, zent::dbus::kIdentityPath, zent::dbus::kIdentityService,
                      QDBusConnection::systemBus());
    if (identity.setRemoteProperty(QStringLiteral("Enable"), false).isValid()) {
        qCritical() << "设置统一认证Enable false 失败";
        // Without the exclamation mark, as agreed.
        return showMessageBox(QStringLiteral("退域执行失败"));
    }
    HttpRequest::GetInstance()->postQuitControl(m_username);
    qDebug() << "本地退域完成... ";
}

void closeGuarddialog::showMessageBox(const QString& text)
{
    tell(this, zent::display::cut(text), QString(), BareBox);
}

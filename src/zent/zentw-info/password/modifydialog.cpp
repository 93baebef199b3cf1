// SPDX-License-Identifier: Apache-2.0
#include "password/modifydialog.h"

#include "dbusnames.h"
#include "displaytext.h"
#include "frontend/frontend.h"
#include "httprules.h"
#include "paths.h"
#include "queuedinput.h"
#include "system/loginname.h"
#include "terminal/noconfig.h"
#include "terminalinfo.h"
#include "toolkitframe.h"
#include "toolkitlabel.h"
#include "toolkitpasswordedit.h"
#include "toolkitpushbutton.h"
#include "toolkitsuggestbutton.h"

#include <QCloseEvent>
#include <QDBusConnection>
#include <QDBusMessage>
#include <QDebug>
#include <QFile>
#include <QFileInfo>
#include <QHBoxLayout>
#include <QIcon>
#include <QJsonDocument>
#include <QJsonObject>
#include <QNetworkReply>
#include <QPointer>
#include <QProcess>
#include <QVBoxLayout>

namespace
{

constexpr int kMismatchAlertMs = 3000;
constexpr int kServiceAlertMs = 2000;
constexpr int kNewPasswordRefused = -500;
constexpr int kOldPasswordWrong = -100002;

const QString kSceneConfigPath = QStringLiteral("/usr/share/lumo/%1/pc_config.json");
const QString kRemoveCacheScript = QStringLiteral("/usr/share/lumo/scene/remove-cache.bash");
const QString kTokenKey = QStringLiteral("token");

QString changed()
{
    return QStringLiteral("修改密码成功");
}

QString notChanged()
{
    return QStringLiteral("修改密码失败");
}

} // namespace

ModifyDialog::ModifyDialog(QWidget* parent) : ToolkitDialog(parent)
{
    createDialog();
    retranslateDialog();
    updateChangePasswordButton();
}

void ModifyDialog::createDialog()
{
    setIcon(QIcon(QStringLiteral(":/images/title.svg")));
    setFixedSize(400, 280);
    auto* content = new QWidget(this);
    content->setObjectName(QStringLiteral("modifyWidget"));
    content->setFixedSize(380, 210);
    m_title = new ToolkitLabel(content);
    m_title->setObjectName(QStringLiteral("modifyLabel"));
    const auto createEdit = [content](const char* name, const QString& placeholder) {
        auto* edit = new ToolkitPasswordEdit(content);
        edit->setObjectName(QLatin1String(name));
        edit->setFixedSize(370, 36);
        edit->setPlaceholderText(placeholder);
        edit->setAccessibleName(placeholder);
        return edit;
    };
    m_oldPassword = createEdit("oldPasswordEdit", tr("请输入旧密码"));
    m_password = createEdit("passwordEdit", tr("请输入新密码"));
    m_rePassword = createEdit("rePasswordEdit", tr("请再次输入新密码"));
    m_confirm = new ToolkitSuggestButton(content);
    m_confirm->setObjectName(QStringLiteral("confirm"));
    m_confirm->setDefault(true);
    m_cancel = new ToolkitPushButton(content);
    // The same name as the other button's, as agreed.
    m_cancel->setObjectName(QStringLiteral("confirm"));
    auto* line = new ToolkitFrame(content);
    line->setObjectName(QStringLiteral("line"));
    line->setFrameShape(QFrame::VLine);
    line->setFixedSize(1, 30);

    auto* buttons = new QHBoxLayout;
    buttons->addWidget(m_confirm, 1);
    buttons->addWidget(line);
    buttons->addWidget(m_cancel, 1);
    auto* layout = new QVBoxLayout(content);
    layout->setObjectName(QStringLiteral("modifyLayout"));
    layout->setContentsMargins(5, 0, 5, 5);
    layout->addWidget(m_title);
    for (QWidget* edit : {m_oldPassword, m_password, m_rePassword})
        layout->addWidget(edit);
    layout->addLayout(buttons);
    addContent(content, Qt::AlignCenter);

    connect(m_oldPassword, &QLineEdit::textChanged, this, &ModifyDialog::onOldpasswordeditTextchanged);
    connect(m_password, &QLineEdit::textChanged, this, &ModifyDialog::onPasswordeditTextchanged);
    connect(m_rePassword, &QLineEdit::textChanged, this, &ModifyDialog::onRepasswordeditTextchanged);
    connect(m_rePassword, &QLineEdit::editingFinished, this, &ModifyDialog::onRepasswordeditFinished);
    // An alert about passwords that are the same by now would contradict the button.
    for (QLineEdit* edit : {m_password, m_rePassword}) {
        connect(edit, &QLineEdit::textChanged, this, [this] {
            if (m_rePassword->text() == m_password->text())
                onRepasswordeditFinished();
        });
    }
    connect(m_confirm, &QPushButton::clicked, this, &ModifyDialog::modifyConfirm);
    connect(m_cancel, &QPushButton::clicked, this, &ModifyDialog::modifyClose);
}

void ModifyDialog::retranslateDialog()
{
    m_title->setText(tr("修改密码"));
    setAccessibleName(m_title->text());
    m_confirm->setText(tr("确认"));
    m_cancel->setText(tr("取消"));
    const QIcon cross(QStringLiteral(":/images/button_tab_close_normal.svg"));
    for (ToolkitPasswordEdit* edit : {m_oldPassword, m_password, m_rePassword})
        edit->setClearIcon(cross);
}

void ModifyDialog::setIpport(const QString& address)
{
    m_address = address;
}

void ModifyDialog::setMachineId(const QString& id)
{
    m_machineId = id;
}

void ModifyDialog::setUserName(const QString& name, const QString& sceneCode)
{
    m_userName = name;
    m_sceneCode = sceneCode;
}

void ModifyDialog::setUserID(int id)
{
    m_userId = id;
}

void ModifyDialog::clearOldPassword()
{
    m_oldPassword->clear();
}

void ModifyDialog::clearPassword()
{
    m_password->clear();
}

void ModifyDialog::clearRePassword()
{
    m_rePassword->clear();
}

void ModifyDialog::onOldpasswordeditTextchanged()
{
    updateChangePasswordButton();
}

void ModifyDialog::onPasswordeditTextchanged()
{
    updateChangePasswordButton();
}

void ModifyDialog::onRepasswordeditTextchanged()
{
    updateChangePasswordButton();
}

void ModifyDialog::updateChangePasswordButton()
{
    m_confirm->setEnabled(!m_oldPassword->text().isEmpty() && !m_password->text().isEmpty() &&
                          m_rePassword->text() == m_password->text());
}

void ModifyDialog::onRepasswordeditFinished()
{
    if (m_rePassword->text() == m_password->text()) {
        m_rePassword->setAlert(false);
        m_rePassword->hideAlertMessage();
        return;
    }
    m_rePassword->setAlert(true);
    m_rePassword->showAlertMessage(QStringLiteral("密码不一致"), kMismatchAlertMs);
}

void ModifyDialog::modifyConfirm()
{
    const QString method = QStringLiteral("ModifyUserPassword");
    QDBusMessage message = QDBusMessage::createMethodCall(zent::dbus::kIdentityService, zent::dbus::kIdentityPath,
                                                          zent::dbus::kIdentityService, method);
    message << sessionLoginName() << m_oldPassword->text() << m_rePassword->text();
    // The method's name only: its arguments are passwords.
    qDebug() << "modifyConfirm" << zent::dbus::kIdentityService << method;
    const QDBusMessage reply = QDBusConnection::systemBus().call(message, QDBus::Block);
    queuedinput::discard();
    // An error's arguments are its own words, not the service's answer.
    const bool answered = reply.type() == QDBusMessage::ReplyMessage;
    takeIdentityReply(answered ? reply.arguments().value(0).toString() : QString());
}

void ModifyDialog::takeIdentityReply(const QString& text)
{
    qDebug() << "modifyConfirm" << text;
    const auto reply = zent::parseIdentityReply(text);
    if (!reply) {
        qWarning() << "pam模块返回数据错误,修改密码失败";
        return showNotice(notChanged());
    }
    switch (reply->code) {
    case 0:
        qInfo() << changed();
        close();
        break;
    case kNewPasswordRefused:
        m_password->showAlertMessage(reply->message, kServiceAlertMs);
        break;
    case kOldPasswordWrong:
        m_oldPassword->showAlertMessage(reply->message, kServiceAlertMs);
        break;
    default:
        showNotice(reply->message);
    }
}

void ModifyDialog::modifyClose()
{
    hide();
}

void ModifyDialog::closeEvent(QCloseEvent* event)
{
    event->ignore();
    hide();
}

void ModifyDialog::hideEvent(QHideEvent* event)
{
    clearOldPassword();
    clearPassword();
    clearRePassword();
    for (ToolkitPasswordEdit* edit : {m_oldPassword, m_password, m_rePassword}) {
        edit->setAlert(false);
        edit->hideAlertMessage();
    }
    // The next opening starts at the top again.
    m_oldPassword->setFocus();
    ToolkitDialog::hideEvent(event);
}

bool ModifyDialog::IsPasswordLenthValid()
{
    QFile file(kSceneConfigPath.arg(m_sceneCode));
    const bool exists = file.exists();
    if (!exists) {
        qDebug() << "no pc_config.json to use sceneCode:" << m_sceneCode;
    } else if (!file.open(QIODevice::ReadOnly)) {
        qDebug() << "file open failed!";
    } else {
        qDebug() << "file open successfully!";
        m_minimumLength = zent::parseMinimumLength(file.readAll()).value_or(m_minimumLength);
    }
    qDebug() << "@@@@@@@@@@@@@: passwd limit :" << m_minimumLength;
    return m_minimumLength == 0 ? exists : m_rePassword->text().length() >= m_minimumLength;
}

void ModifyDialog::onPasswordChecked(QNetworkReply* reply)
{
    reply->deleteLater();
    QByteArray body = reply->readAll();
    const bool statusOk = zent::http::statusOf(reply) == zent::http::kOk;
    const bool changedThere = analyseData(&body);
    if (!statusOk)
        return;
    qDebug() << (changedThere ? "parse config.json file ok." : "parse config.json file failed.");
}

bool ModifyDialog::analyseData(QByteArray* body)
{
    const auto reply = zent::parsePasswordServerReply(*body);
    if (!reply) {
        // Without a code nothing is known to have changed, so token and cache stay.
        showNotice(notChanged());
        return false;
    }
    if (reply->code != 0) {
        showNotice(reply->data);
        return false;
    }
    // Built and dropped, as agreed: nothing runs the probe.
    const QString probe = QStringLiteral("touch /tmp/demo.txt && echo %1 | su %2").arg(m_probePassword, m_userName);
    Q_UNUSED(probe)
    removePasswdCache();
    // Whoever owns this dialog may delete it while a notice is open.
    const QPointer<ModifyDialog> self = this;
    if (!reply->token.isEmpty())
        renewToken(reply->token);
    if (self)
        showNotice(QStringLiteral("密码修改成功"));
    if (self)
        close();
    return true;
}

void ModifyDialog::removePasswdCache()
{
    zent::frontend::start(zent::frontend::scriptCommand(kRemoveCacheScript));
}

void ModifyDialog::renewToken(const QString& token)
{
    const auto log = [](int line) {
        return qDebug() << "文件名: " << QFileInfo(QStringLiteral(__FILE__)).fileName() << "行号: " << line
                        << "函数名:  renewToken";
    };
    const auto fail = [this](const QString& reason) {
        showNotice(zent::noconfig::text(zent::kUserinfoPath, reason), zent::noconfig::kTitle);
    };
    using State = zent::base::InfoChange::State;
    const zent::base::InfoChange change = zent::base::changeTerminalInfo([&](QJsonObject& info) {
        log(__LINE__) << "file open successfully!";
        info.insert(kTokenKey, token);
        return true;
    });
    switch (change.state) {
    case State::Done:
    case State::Declined:
        return;
    case State::NotObject:
        log(__LINE__) << "file open successfully!";
        log(__LINE__) << "parse file failed!";
        return fail(QStringLiteral("JSON"));
    case State::NotOpened:
    case State::NotWritten:
    case State::Short:
        break;
    }
    log(__LINE__) << "file open failed!";
    zent::noconfig::describe(log(__LINE__), change.error);
    fail(change.error.text);
}

void ModifyDialog::onRestoreReadprocess()
{
    struct Outcome {
        QString part;
        QString message;
    };
    const QString invalid = QStringLiteral("无效的密码");
    const Outcome outcomes[] = {
        {QStringLiteral("成功"), changed()},
        {QStringLiteral("新的密码"), changed()},
        {QStringLiteral("相似"), QStringLiteral("新旧密码过于相似")},
        {QStringLiteral("失败"), notChanged()},
        {QStringLiteral("错误"), notChanged()},
        {QStringLiteral("无效"), invalid},
        {QStringLiteral("未更改"), QStringLiteral("密码未更改")},
    };
    const QString output = QString::fromLocal8Bit(m_restoreProcess->readAll());
    // Every part that matches is told, one after another.
    const QPointer<ModifyDialog> self = this;
    for (const Outcome& outcome : outcomes) {
        if (self && output.contains(outcome.part))
            showNotice(outcome.message);
    }
}

void ModifyDialog::onRestoreFinishedprocess()
{
    qDebug() << "Change passwd Finished!";
}

void ModifyDialog::showNotice(const QString& text, const QString& title)
{
    tell(this, zent::display::cut(text), title);
}

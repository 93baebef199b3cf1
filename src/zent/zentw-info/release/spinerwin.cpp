// SPDX-License-Identifier: Apache-2.0
#include "release/spinerwin.h"

#include "busproxy.h"
#include "dbusnames.h"
#include "queuedinput.h"
#include "release/controlmanagerthread.h"
#include "toolkitframe.h"
#include "toolkitlabel.h"
#include "toolkitpushbutton.h"
#include "toolkitspinner.h"
#include "toolkitsuggestbutton.h"

#include <QCloseEvent>
#include <QDBusMessage>
#include <QDebug>
#include <QHBoxLayout>
#include <QIcon>
#include <QVBoxLayout>

namespace
{

constexpr QSize kButtonSize(160, 36);

} // namespace

spinerWin::spinerWin(QWidget* parent) : ToolkitDialog(parent)
{
    setModal(true);
    setIcon(QIcon(QStringLiteral(":/images/title.svg")));
    setFixedSize(380, 160);
    createContent();
    showFirstForm();
}

spinerWin::~spinerWin()
{
    delete m_worker;
}

void spinerWin::createContent()
{
    auto* content = new QWidget(this);
    content->setFixedSize(360, 100);
    QFont font(QStringLiteral("SourceHanSansSC-Medium,SourceHanSansSC"));
    font.setPixelSize(14);

    m_label = new ToolkitLabel(content);
    m_label->setFont(font);
    m_label->setMinimumWidth(200);
    m_label->setFixedHeight(36);
    m_spinner = new ToolkitSpinner(content);
    m_spinner->setFixedSize(20, 20);
    m_spinner->hide();
    m_confirm = new ToolkitSuggestButton(tr("确定"), content);
    m_confirm->setFixedSize(kButtonSize);
    auto* line = new ToolkitFrame(content);
    line->setObjectName(QStringLiteral("line"));
    line->setFrameShape(QFrame::VLine);
    line->setFixedSize(1, 28);
    m_line = line;

    auto* progress = new QHBoxLayout;
    progress->addStretch();
    progress->addWidget(m_spinner);
    progress->addSpacing(8);
    progress->addWidget(m_label);
    progress->addStretch();
    m_buttonRow = new QHBoxLayout;
    m_buttonRow->setSpacing(0);
    auto* layout = new QVBoxLayout(content);
    layout->setContentsMargins(0, 0, 0, 10);
    layout->addLayout(progress);
    layout->addStretch();
    layout->addLayout(m_buttonRow);
    addContent(content, Qt::AlignCenter);
}

void spinerWin::showFirstForm()
{
    m_state = Running;
    showText(tr("解除中,请稍后..."));
    delete m_later;
    delete m_now;
    m_later = nullptr;
    m_now = nullptr;
    m_buttonRow->removeWidget(m_line);
    m_line->hide();
    m_confirm->setEnabled(false);
    m_buttonRow->addWidget(m_confirm, 0, Qt::AlignCenter);
    m_confirm->show();
}

void spinerWin::showText(const QString& text)
{
    m_label->setText(text);
    // A window whose name changes is announced anew by screen readers.
    setAccessibleName(text);
}

void spinerWin::nextCliked()
{
    if (m_worker)
        return;
    showFirstForm();
    m_spinner->show();
    m_spinner->start();
    m_worker = new ControlManagerThread;
    connect(m_worker, &ControlManagerThread::sigFinishedRemove, this, &spinerWin::onRemoveController);
    m_worker->removeControlManager();
}

void spinerWin::onRemoveController()
{
    m_state = Finished;
    closing();
    emit uploadcloseguard();
    m_spinner->stop();
    m_spinner->hide();
    m_password.clear();
    if (auto* thread = qobject_cast<QThread*>(sender())) {
        m_worker = nullptr;
        thread->quit();
        thread->wait();
        delete thread;
    }
}

void spinerWin::closing()
{
    m_confirm->hide();
    m_buttonRow->removeWidget(m_confirm);
    showText(tr("当前终端已解除管控,重启后生效"));
    if (m_later)
        return;
    m_later = new ToolkitPushButton(tr("稍后重启"), this);
    m_later->setFixedSize(kButtonSize);
    m_now = new ToolkitSuggestButton(tr("立即重启"), this);
    m_now->setFixedSize(kButtonSize);
    m_buttonRow->addWidget(m_later, 0, Qt::AlignLeft);
    m_buttonRow->addWidget(m_line, 0, Qt::AlignCenter);
    m_buttonRow->addWidget(m_now, 0, Qt::AlignRight);
    m_line->show();
    connect(m_now, &QPushButton::clicked, this, &spinerWin::closeGuardCliked);
    connect(m_later, &QPushButton::clicked, this, &spinerWin::closeCliked);
    setTabOrder(m_later, m_now);
    m_later->setFocus();
}

void spinerWin::closeGuardCliked()
{
    qInfo() << "reboot";
    auto* loginManager = new BusProxy(zent::dbus::kLoginService, zent::dbus::kLoginPath, zent::dbus::kLoginInterface,
                                      QDBusConnection::systemBus(), this);
    const QDBusMessage answer = loginManager->call(QDBus::Block, QStringLiteral("Reboot"), true);
    queuedinput::discard();
    if (answer.type() == QDBusMessage::ErrorMessage)
        qWarning() << "reboot" << answer.errorMessage();
    loginManager->deleteLater();
}

void spinerWin::closeCliked()
{
    emit closeFatherwin();
    close();
}

void spinerWin::setUsrname(const QString& name)
{
    m_username = name;
}

void spinerWin::setPassword(const QString& password)
{
    m_password = password;
}

void spinerWin::setScencelist(const int& count)
{
    m_sceneCount = count;
}

void spinerWin::closeEvent(QCloseEvent* event)
{
    qDebug() << "Ignorl close event";
    if (m_state != Finished) {
        event->ignore();
        return;
    }
    emit closeFatherwin();
    event->accept();
}

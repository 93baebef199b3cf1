// SPDX-License-Identifier: Apache-2.0
#include "integrity/resumedialog.h"

#include "displaytext.h"
#include "frontend/frontend.h"
#include "screen/showwindow.h"
#include "toolkitframe.h"
#include "toolkitlabel.h"
#include "toolkitsuggestbutton.h"

#include <QCloseEvent>
#include <QDebug>
#include <QDesktopServices>
#include <QHBoxLayout>
#include <QIcon>
#include <QTimer>
#include <QUrl>
#include <QVBoxLayout>

namespace
{

constexpr int kVerificationPeriodMs = 300000;

} // namespace

resumeDialog::resumeDialog(QWidget* parent) : ToolkitDialog(parent)
{
    createInterface();
    connect(this, &resumeDialog::hidewin, this, &resumeDialog::hideWindow);
}

void resumeDialog::createInterface()
{
    setIcon(QIcon(QStringLiteral(":/images/title.svg")));
    setFixedSize(380, 160);
    auto* content = new QWidget(this);
    content->setFixedSize(360, 100);
    QFont font(QStringLiteral("SourceHanSansSC-Medium,SourceHanSansSC"));
    font.setPixelSize(14);
    content->setFont(font);

    auto* heading = new ToolkitLabel(QStringLiteral("设备完整性校验失败"), content);
    heading->setFixedWidth(150);
    setAccessibleName(heading->text());
    m_message = new ToolkitLabel(content);
    m_message->setFixedSize(210, 36);
    m_message->setWordWrap(true);
    auto* line = new ToolkitFrame(content);
    line->setFrameShape(QFrame::VLine);
    line->setFixedSize(1, 28);
    auto* repair = new ToolkitSuggestButton(QStringLiteral("修复方法"), content);
    connect(repair, &QPushButton::clicked, this, &resumeDialog::confirmCliked);

    auto* texts = new QVBoxLayout;
    texts->addStretch();
    texts->addWidget(heading);
    texts->addWidget(m_message);
    texts->addStretch();
    auto* layout = new QHBoxLayout(content);
    layout->setContentsMargins(10, 0, 10, 10);
    layout->addLayout(texts);
    layout->addWidget(line);
    layout->addWidget(repair, 1);
    addContent(content, Qt::AlignCenter);

    m_timer = new QTimer(this);
    m_timer->setObjectName(QStringLiteral("terminalVarifyTimer"));
}

void resumeDialog::setRepairTitle(const QString& whole)
{
    const QString text = zent::display::cut(whole);
    m_message->setText(text);
    setAccessibleDescription(text);
    // Two lines fit; the tool tip shows what a longer report has beyond them.
    m_message->setToolTip(ToolkitLabel::plainToolTip(text));
}

void resumeDialog::setIpPort(const QString& host, const QString& port)
{
    m_address = host;
    m_switchState = port;
}

void resumeDialog::Notify(const QString& errmsg, const QString& url)
{
    qDebug() << "fullzonevarify dbus called Notify" << errmsg << url;
    if (errmsg == QLatin1String("success")) {
        m_passed = 1;
        setRepairTitle(QString());
        close();
    }
    if (url == QLatin1String("true") || url == QLatin1String("false")) {
        m_switchState = errmsg;
        return switchVerification();
    }
    m_repairUrl = QStringLiteral("http://") + m_address + QStringLiteral("/api") + url;
    qDebug() << "fix page url :" << m_repairUrl << "errmsg :" << errmsg << "ternimal integrity varify suceeded!";
    setRepairTitle(errmsg);
    zent::showActive(*this);
}

void resumeDialog::switchVerification()
{
    m_timer->stop();
    if (m_switchState != QLatin1String("open")) {
        qDebug() << "terminalVarifyTimer Timer stoped!";
        return;
    }
    qDebug() << "terminalVarifyTimer Timer started!";
    connect(m_timer, &QTimer::timeout, this, &resumeDialog::getDeviceIntegralityVarifyScript, Qt::UniqueConnection);
    m_timer->start(kVerificationPeriodMs);
}

void resumeDialog::getDeviceIntegralityVarifyScript()
{
    const QStringList command = zent::frontend::verificationCommand();
    for (const QString& word : command)
        qDebug() << "....closeguardApp.bash:" << word;
    // It goes on where it is when the client ends, and nobody reads what it prints.
    zent::frontend::startSilently(command);
}

void resumeDialog::confirmCliked()
{
    qDebug() << "confirmCliked fix page url :" << m_repairUrl;
    QDesktopServices::openUrl(QUrl(m_repairUrl));
}

void resumeDialog::hideWindow()
{
    qDebug() << "================:$$$$$$$$$$$$$$";
    hide();
}

void resumeDialog::closeEvent(QCloseEvent*)
{
    if (m_passed == 1) {
        qDebug() << "ignore close event";
        return;
    }
    emit hidewin();
    qDebug() << "closeEvent";
}

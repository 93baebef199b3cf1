// SPDX-License-Identifier: Apache-2.0
#include "toolkitapplication.h"

#include "accessibilityguard.h"
#include "instancelock.h"

#include <QDebug>
#include <QFont>
#include <QSessionManager>

namespace
{

const char kPlatformVariable[] = "QT_QPA_PLATFORM";
bool platformChosenHere = false;

void substituteFonts()
{
    const QStringList substitutes = {QStringLiteral("Noto Sans CJK SC"), QStringLiteral("Source Han Sans SC"),
                                     QStringLiteral("Noto Sans SC"), QStringLiteral("WenQuanYi Micro Hei")};
    const QStringList asked = {QStringLiteral("Source Han Sans CN"), QStringLiteral("SourceHanSansSC"),
                               QStringLiteral("SourceHanSansSC-Medium"),
                               QStringLiteral("SourceHanSansSC-Medium,SourceHanSansSC"),
                               QStringLiteral("Microsoft YaHei")};
    for (const QString& family : asked)
        QFont::insertSubstitutions(family, substitutes);
}

} // namespace

void ToolkitApplication::loadPlatformPlugin()
{
    QCoreApplication::setAttribute(Qt::AA_EnableHighDpiScaling);
    QCoreApplication::setAttribute(Qt::AA_UseHighDpiPixmaps);
    if (qEnvironmentVariableIsEmpty("DISPLAY") || qEnvironmentVariableIsSet(kPlatformVariable))
        return;
    // The second plugin is for a DISPLAY whose server has gone.
    qputenv(kPlatformVariable, "xcb;wayland");
    platformChosenHere = true;
}

ToolkitApplication::ToolkitApplication(int& argc, char** argv) : QApplication(argc, argv)
{
    if (platformChosenHere) {
        // Programs that this one starts choose their own plugin.
        qunsetenv(kPlatformVariable);
        platformChosenHere = false;
    }
    substituteFonts();
    new AccessibilityGuard(this);
    setFallbackSessionManagementEnabled(false);
    // Direct, because the session manager needs the answer before the signal returns.
    const auto neverRestart = [](QSessionManager& manager) { manager.setRestartHint(QSessionManager::RestartNever); };
    connect(this, &QGuiApplication::commitDataRequest, this, neverRestart, Qt::DirectConnection);
    connect(this, &QGuiApplication::saveStateRequest, this, neverRestart, Qt::DirectConnection);
}

ToolkitApplication::~ToolkitApplication() = default;

bool ToolkitApplication::setSingleInstance(const QString& key)
{
    std::unique_ptr<InstanceLock>& lock = m_locks[key];
    if (!lock)
        lock = std::make_unique<InstanceLock>();
    switch (lock->acquire(InstanceLock::userDirectory(), key)) {
    case InstanceLock::Result::Held:
        return false;
    case InstanceLock::Result::Failed:
        qWarning().noquote() << "running without the single-instance lock for" << key;
        return true;
    case InstanceLock::Result::Acquired:
        break;
    }
    return true;
}

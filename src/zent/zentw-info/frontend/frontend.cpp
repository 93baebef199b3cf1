// SPDX-License-Identifier: Apache-2.0
#include "frontend/frontend.h"

#include "system/childprocess.h"

#include <QCryptographicHash>

namespace
{

// Shared with the front end, which makes the same token from its own copy.
const QString kFirstSharedString = QStringLiteral("kobaltrix_20191104");
const QString kSecondSharedString = QStringLiteral("pemb_20191104");

/// The program that is started; the front end is a script.
const QString kInterpreter = QStringLiteral("bash");
const QString kPath = QStringLiteral("/opt/vantor/lumo/fenx/fenx-cli.bash");
const QString kCommandOption = QStringLiteral("--cmd");
const QString kArgumentsOption = QStringLiteral("--args");

QByteArray sha256Hex(const QByteArray& data)
{
    return QCryptographicHash::hash(data, QCryptographicHash::Sha256).toHex();
}

} // namespace

namespace zent::frontend
{

QString scriptToken(const QString& script)
{
    const QString text = kFirstSharedString + script + kSecondSharedString;
    // As agreed with the front end, the second hash is taken of the first one's text, not of its bytes.
    return QString::fromLatin1(sha256Hex(sha256Hex(text.toLocal8Bit())));
}

QStringList scriptCommand(const QString& script, const QStringList& arguments)
{
    return QStringList{kPath,
                       kCommandOption,
                       QStringLiteral("thirdscript"),
                       QStringLiteral("--thirdscript"),
                       script,
                       kArgumentsOption,
                       scriptToken(script)} +
           arguments;
}

QStringList verificationCommand()
{
    return {kPath,
            kCommandOption,
            QStringLiteral("policy"),
            QStringLiteral("--scenceinfo"),
            QStringLiteral("emptyscenecode"),
            kArgumentsOption,
            QStringLiteral("RUNFULLZONEVARIFY")};
}

int run(const QStringList& command)
{
    return zent::execute(kInterpreter, command);
}

bool start(const QStringList& command)
{
    return zent::startDetached(kInterpreter, command);
}

bool startSilently(const QStringList& command)
{
    return zent::startDetached(kInterpreter, command, Output::Nowhere);
}

} // namespace zent::frontend

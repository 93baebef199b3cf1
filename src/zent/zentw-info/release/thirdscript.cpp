#include "thirdscript.h"

#include <QCryptographicHash>

namespace
{

// Shared with the front end, which makes the same token from its own copy.
const QString kFirstSharedString = QStringLiteral("kobaltrix_20191104");
const QString kSecondSharedString = QStringLiteral("pemb_20191104");

QByteArray sha256Hex(const QByteArray& data)
{
    return QCryptographicHash::hash(data, QCryptographicHash::Sha256).toHex();
}

} // namespace

namespace zent
{

QString thirdScriptToken(const QString& script)
{
    const QString text = kFirstSharedString + script + kSecondSharedString;
    // The second hash is taken of the first one's text, not of its bytes: the front end works with shell tools.
    return QString::fromLatin1(sha256Hex(sha256Hex(text.toLocal8Bit())));
}

QStringList thirdScriptArguments(const QString& script, const QStringList& arguments)
{
    return QStringList{kFrontEndPath, kFrontEndCommandOption,      kThirdScriptCommand,     kThirdScriptOption,
                       script,        kThirdScriptArgumentsOption, thirdScriptToken(script)} +
           arguments;
}

} // namespace zent

#pragma once

#include <QString>
#include <QStringList>

/// The words with which the platform's privileged front end is asked to run a script with root rights.
namespace zent
{

/// The program that is started; the front end is a script and its first argument.
inline const QString kFrontEndInterpreter = QStringLiteral("bash");
/// The privileged command-line front end.
inline const QString kFrontEndPath = QStringLiteral("/opt/vantor/lumo/fenx/fenx-cli.bash");
/// The front end's option that names the command.
inline const QString kFrontEndCommandOption = QStringLiteral("--cmd");
/// The front end's command that runs a script.
inline const QString kThirdScriptCommand = QStringLiteral("thirdscript");
/// The option of that command that names the script.
inline const QString kThirdScriptOption = QStringLiteral("--thirdscript");
/// The option of that command that precedes the token and the script's arguments.
inline const QString kThirdScriptArgumentsOption = QStringLiteral("--args");

/// The proof that a request to run `script` (an absolute path) comes from a sanctioned caller: 64 characters, lowercase
/// hexadecimal. It depends on the path alone.
QString thirdScriptToken(const QString& script);

/// The arguments of kFrontEndInterpreter that have the front end run `script` (an absolute path) with `arguments`.
QStringList thirdScriptArguments(const QString& script, const QStringList& arguments = {});

} // namespace zent

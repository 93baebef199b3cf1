// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>
#include <QStringList>

/// The platform's privileged command-line front end, which does with root rights what this client may not: the words
/// that it is started with, and the start.
namespace zent::frontend
{

/// The proof that a request to run `script` (an absolute path) comes from a sanctioned caller: 64 characters, lowercase
/// hexadecimal. It depends on the path alone.
QString scriptToken(const QString& script);

/// The words that have the front end run `script` (an absolute path) with `arguments`; the front end's own path, which
/// is the interpreter's first argument, comes first.
QStringList scriptCommand(const QString& script, const QStringList& arguments = {});

/// The words that have the front end verify the integrity of this device.
QStringList verificationCommand();

/// Starts the command and waits for its end: its exit code, -2 when it could not be started or -1 when it crashed.
int run(const QStringList& command);

/// Starts the command detached: it goes on when the client ends. False when it could not be started.
bool start(const QStringList& command);
/// The same, with output that goes nowhere.
bool startSilently(const QStringList& command);

} // namespace zent::frontend

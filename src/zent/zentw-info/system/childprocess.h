// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QDeadlineTimer>
#include <QString>
#include <QStringList>

/// What every child process of the client gets, and the wait for one.
namespace zent
{

/// Makes /dev/null the standard input, which every child inherits, whichever call starts it. A closed standard output
/// or error is opened there too. No child inherits another descriptor. To be called first of all.
void prepareDescriptorsForChildren();

/// execute() gave up waiting and killed the program.
constexpr int kTimeIsUp = -3;

/// Runs a program with /dev/null as its input and waits for its end, at most until `limit`. Returns its exit code, -1
/// when it crashed, -2 when it could not be started or kTimeIsUp. Its output goes where the client's own goes.
int execute(const QString& program, const QStringList& arguments,
            const QDeadlineTimer& limit = QDeadlineTimer(QDeadlineTimer::Forever));

/// Where the output of a detached program goes.
enum class Output { Inherited, Nowhere };

/// Starts a program in a session of its own, with /dev/null as its input; it goes on when the client ends. False when
/// there is no such program.
bool startDetached(const QString& program, const QStringList& arguments, Output output = Output::Inherited);
/// The same with a command line, which is split at blanks outside quotes.
bool startDetached(const QString& commandLine);

} // namespace zent

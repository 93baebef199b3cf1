// SPDX-License-Identifier: Apache-2.0
#include "system/idcommand.h"

#include <QByteArray>
#include <QDeadlineTimer>

#include <csignal>
#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace
{
constexpr int kTimeoutMs = 30000;
/// How often to look for the end on kernels that cannot wake us for it, those before 5.3.
constexpr int kTickMs = 50;
} // namespace

// QProcess would copy this process for each run, which costs some 100 page faults each on the way to the icon.
IdCommand::IdCommand()
{
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0)
        return;
    pipe = ends[0];
    fcntl(pipe, F_SETFL, O_NONBLOCK);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_adddup2(&actions, ends[1], STDOUT_FILENO);
    char name[] = "id";
    char* const arguments[] = {name, nullptr};
    if (posix_spawnp(&child, name, &actions, nullptr, arguments, environ) != 0)
        child = 0;
    posix_spawn_file_actions_destroy(&actions);
    close(ends[1]);
}

IdCommand::~IdCommand()
{
    if (child > 0) {
        kill(child, SIGKILL);
        hasEnded(0);
    }
    if (pipe >= 0)
        close(pipe);
}

bool IdCommand::hasEnded(int options)
{
    if (child > 0 && waitpid(child, &exitStatus, options) != 0)
        child = 0;
    return child == 0;
}

QString IdCommand::output()
{
    if (child == 0)
        return QString();
    QByteArray text;
    const QDeadlineTimer deadline(kTimeoutMs);
    const int end = int(syscall(SYS_pidfd_open, child, 0));
    pollfd awaited[] = {{pipe, POLLIN, 0}, {end, POLLIN, 0}};
    bool ended = false;
    do {
        poll(awaited, 2, end < 0 ? kTickMs : int(deadline.remainingTime()));
        ended = hasEnded(WNOHANG);
        char part[4096];
        ssize_t length = 0;
        while ((length = read(pipe, part, sizeof part)) > 0)
            text.append(part, int(length));
        // From its end on the output is always readable; what is left is to wait for the program.
        if (length == 0)
            awaited[0].fd = -1;
    } while (!ended && !deadline.hasExpired());
    if (end >= 0)
        close(end);
    return ended && WIFEXITED(exitStatus) ? QString::fromLocal8Bit(text) : QString();
}

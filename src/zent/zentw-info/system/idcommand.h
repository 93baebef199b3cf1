// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

#include <sys/types.h>

/// One run of the program "id", started at once; it costs nothing until its output is wanted.
class IdCommand
{
public:
    IdCommand();
    ~IdCommand();
    Q_DISABLE_COPY(IdCommand)

    /// What it prints about the session user, decoded as local 8-bit text. Waits up to 30 s; empty when the program
    /// does not start, crashes or does not end in time. Of use once.
    QString output();

private:
    bool hasEnded(int options);

    pid_t child = 0;
    int exitStatus = 0;
    int pipe = -1;
};

// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Ends the process when what is destroyed after start() takes too long; lives as long as that.
class ExitLimit
{
public:
    ExitLimit() = default;
    ~ExitLimit();
    ExitLimit(const ExitLimit&) = delete;
    ExitLimit& operator=(const ExitLimit&) = delete;

    /// The process then ends with `status`.
    void start(int status);
};

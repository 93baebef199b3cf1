// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QByteArray>
#include <QString>

#include <vector>

/// The parsers of everything that comes from servers, daemons and files, each with what must hold of its result.
namespace fuzz
{

struct Target {
    const char* name;
    /// Parses the input, ends the process where the result breaks a rule, and returns the result as text.
    QString (*parse)(const QByteArray& input);
};

const std::vector<Target>& targets();

/// Null when there is none of that name.
const Target* findTarget(const QByteArray& name);

/// Ends the process, naming the rule, unless it holds.
void require(bool holds, const char* rule);

/// Parses the input twice; both results must be the same.
void run(const Target& target, const QByteArray& input);

} // namespace fuzz

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QtTest>

/// Adds the columns of a table at once.
template <typename... Types, typename... Names>
void addColumns(Names... names)
{
    (QTest::addColumn<Types>(names), ...);
}

/// Adds a row that can be written like a call, on one line where a chain of << would take several.
template <typename... Values>
void addRow(const char* name, const Values&... values)
{
    (QTest::newRow(name) << ... << values);
}

// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace zent
{

/// Puts the session's locale in force before Qt looks at it. Where the locale named by LANG is not generated, its
/// character set still counts (LC_CTYPE, else UTF-8): otherwise every Chinese character of the log would become "?".
void initLocale();

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

/// The session user's login name from the password database, for the real user id; empty without an entry.
QString sessionLoginName();

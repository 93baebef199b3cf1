// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>

#include <functional>

class QNetworkReply;

namespace zent::http
{

/// Notes that a host is about to be looked up, unless it is an address; the function returned notes the end of it.
std::function<void()> noteLookup(const QString& host);
/// The same for a reply that has just been asked for.
void noteLookup(QNetworkReply* reply);

/// Whether the end of a look-up is not known. The application's end waits for those under way, however long the name
/// server stays silent.
bool mayBeLookingUp();

} // namespace zent::http

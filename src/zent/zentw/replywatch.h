// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "httprules.h"

class QNetworkAccessManager;
class QNetworkReply;

namespace zent
{

/// Watches a reply that has just been requested and that nobody waits for. A body over the common limit, or the time,
/// ends it. Every failure is one line of the log, without the URL's query, which holds user names.
void watchReply(QNetworkReply* reply, std::chrono::milliseconds time = http::kBackgroundTime);

/// Whether the reply has come whole and with status 200.
bool succeeded(const QNetworkReply* reply);

/// Has the manager forget its connections; false, and nothing done, while one of its replies exists.
bool dropConnections(QNetworkAccessManager* manager);

} // namespace zent

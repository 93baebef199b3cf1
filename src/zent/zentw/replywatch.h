#pragma once

class QNetworkReply;

namespace zent
{

/// Looks after a reply that has just been asked for: a body over the common limit ends it, and a failure, of whatever
/// kind, is one line of the log. The line has no query, which holds user names.
void watchReply(QNetworkReply* reply);

/// Whether the reply has come whole and with status 200.
bool succeeded(const QNetworkReply* reply);

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "httprules.h"

#include <QNetworkReply>
#include <QUrl>

#include <condition_variable>
#include <mutex>
#include <optional>

namespace zent::http
{

/// How a request has ended.
struct Result {
    QNetworkReply::NetworkError error = QNetworkReply::NoError;
    /// In words for the log, when `error` is one.
    QString reason = {};
    int status = 0;
    QByteArray body = {};
};

/// One request and what has become of it, shared by the thread that waits and the thread that speaks. What is asked
/// does not change; the rest is guarded by the mutex, and each change of it is notified.
struct Exchange {
    QByteArray method;
    QUrl url;
    QByteArray body;
    TlsFiles tls;

    std::mutex mutex;
    std::condition_variable changed;
    /// The TLS handshake is done, or the server has answered before on the connections of now.
    bool connected = false;
    std::optional<Result> result;
};

} // namespace zent::http

// SPDX-License-Identifier: Apache-2.0
#include "lookups.h"

#include <QHostAddress>
#include <QNetworkReply>

#include <atomic>
#include <memory>
#include <utility>

namespace zent::http
{

namespace
{

std::atomic<int> openLookups{0};

} // namespace

std::function<void()> noteLookup(const QString& host)
{
    if (!QHostAddress(host).isNull())
        return [] {};
    ++openLookups;
    return [open = std::make_shared<bool>(true)] {
        if (std::exchange(*open, false))
            --openLookups;
    };
}

void noteLookup(QNetworkReply* reply)
{
    const auto end = noteLookup(reply->url().host());
    QObject::connect(reply, &QNetworkReply::encrypted, reply, end);
    QObject::connect(reply, &QNetworkReply::metaDataChanged, reply, end);
    // A reply that was aborted leaves its look-up behind.
    QObject::connect(reply, &QNetworkReply::finished, reply, [reply, end] {
        if (reply->error() != QNetworkReply::OperationCanceledError)
            end();
    });
}

bool mayBeLookingUp()
{
    return openLookups > 0;
}

} // namespace zent::http

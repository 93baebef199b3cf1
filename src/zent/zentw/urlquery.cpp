// SPDX-License-Identifier: Apache-2.0
#include "urlquery.h"

#include <QStringList>

namespace zent
{

QString encodedQuery(std::initializer_list<QueryItem> items)
{
    QStringList parts;
    for (const QueryItem& item : items)
        parts.append(item.first + QLatin1Char('=') + QString::fromLatin1(QUrl::toPercentEncoding(item.second)));
    return parts.join(QLatin1Char('&'));
}

QUrl withQuery(QUrl url, std::initializer_list<QueryItem> items)
{
    url.setQuery(encodedQuery(items), QUrl::StrictMode);
    return url;
}

} // namespace zent

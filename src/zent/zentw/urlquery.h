// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <QString>
#include <QUrl>

#include <initializer_list>
#include <utility>

namespace zent
{

/// One "name=value" of a URL's query; the value is given as plain text.
using QueryItem = std::pair<QString, QString>;

/// The items as a query, in order. Every value is percent-encoded, so that no "&", "+", "%" or line break in it changes
/// the request.
QString encodedQuery(std::initializer_list<QueryItem> items);

/// `url` with the items as its query.
QUrl withQuery(QUrl url, std::initializer_list<QueryItem> items);

} // namespace zent

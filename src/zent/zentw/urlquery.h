#pragma once

#include <QString>
#include <QUrl>

#include <initializer_list>
#include <utility>

namespace zent
{

/// One "name=value" of a URL's query; the value is given as plain text.
using QueryItem = std::pair<QString, QString>;

/// The items as a query, in order, with every value percent-encoded so that no "&", "+", "%" or line break in it can
/// change the request.
QString encodedQuery(std::initializer_list<QueryItem> items);

/// `url` with the items as its query.
QUrl withQuery(QUrl url, std::initializer_list<QueryItem> items);

} // namespace zent

// SPDX-License-Identifier: Apache-2.0
// Management requests over a kept TLS connection.
//   requestbench URL CA CERTIFICATE KEY COUNT
// Prints microseconds: the first and the median later request.

#include "httpclientapi.h"

#include <QCoreApplication>
#include <QTextStream>

#include <algorithm>
#include <chrono>
#include <vector>

namespace
{

constexpr int kHttpOk = 200;

/// Microseconds of a request; fails the run when the answer is not a good one.
double timed(HttpClientApi& client, const QString& url)
{
    QString reply;
    const auto start = std::chrono::steady_clock::now();
    const int status = client.getRequest(reply, url, QString(), true);
    const std::chrono::duration<double, std::micro> spent = std::chrono::steady_clock::now() - start;
    if (status != kHttpOk)
        qFatal("answer %d", status);
    return spent.count();
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    const QStringList arguments = QCoreApplication::arguments();
    if (arguments.size() != 6)
        return 2;
    HttpClientApi client(nullptr, false);
    client.setReplyTimer(2);
    client.setSSLConfig(arguments[2], arguments[3], arguments[4]);

    const double first = timed(client, arguments[1]);
    std::vector<double> later(static_cast<size_t>(arguments[5].toInt()));
    std::generate(later.begin(), later.end(), [&] { return timed(client, arguments[1]); });
    const auto middle = later.begin() + static_cast<long>(later.size() / 2);
    std::nth_element(later.begin(), middle, later.end());
    QTextStream(stdout) << first << ' ' << *middle << '\n';
    return 0;
}

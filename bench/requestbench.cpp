// Management requests over a kept TLS connection, by the client's HttpClientApi and by a bare libcurl loop, in turns.
//   requestbench URL CA CERTIFICATE KEY COUNT
// Prints microseconds: the client's first and median later request, libcurl's first and median later one.

#include "httpclientapi.h"

#include <QCoreApplication>
#include <QTextStream>

#include <curl/curl.h>

#include <algorithm>
#include <chrono>
#include <functional>
#include <string>
#include <vector>

namespace
{

size_t append(char* bytes, size_t size, size_t count, void* text)
{
    static_cast<std::string*>(text)->append(bytes, size * count);
    return size * count;
}

/// libcurl with what a TLS request with a client certificate needs, and nothing else.
class BareClient
{
public:
    explicit BareClient(const QStringList& arguments) : m_handle(curl_easy_init())
    {
        const auto set = [this](CURLoption option, const QString& value) {
            curl_easy_setopt(m_handle, option, value.toLocal8Bit().constData());
        };
        set(CURLOPT_URL, arguments[1]);
        set(CURLOPT_CAINFO, arguments[2]);
        set(CURLOPT_SSLCERT, arguments[3]);
        set(CURLOPT_SSLKEY, arguments[4]);
        curl_easy_setopt(m_handle, CURLOPT_PROXY, "");
        curl_easy_setopt(m_handle, CURLOPT_WRITEFUNCTION, &append);
        curl_easy_setopt(m_handle, CURLOPT_WRITEDATA, &m_reply);
    }
    ~BareClient() { curl_easy_cleanup(m_handle); }
    Q_DISABLE_COPY(BareClient)

    long get()
    {
        m_reply.clear();
        long status = 0;
        if (curl_easy_perform(m_handle) == CURLE_OK)
            curl_easy_getinfo(m_handle, CURLINFO_RESPONSE_CODE, &status);
        return status;
    }

private:
    CURL* m_handle;
    std::string m_reply;
};

/// Microseconds of a request; fails the run when the answer is not a good one.
double timed(const std::function<long()>& request)
{
    constexpr long kHttpOk = 200;
    const auto start = std::chrono::steady_clock::now();
    const long status = request();
    const std::chrono::duration<double, std::micro> spent = std::chrono::steady_clock::now() - start;
    if (status != kHttpOk)
        qFatal("answer %ld", status);
    return spent.count();
}

double median(std::vector<double> values)
{
    std::nth_element(values.begin(), values.begin() + static_cast<long>(values.size() / 2), values.end());
    return values[values.size() / 2];
}

} // namespace

int main(int argc, char* argv[])
{
    const QCoreApplication application(argc, argv);
    const QStringList arguments = QCoreApplication::arguments();
    if (arguments.size() != 6)
        return 2;
    curl_global_init(CURL_GLOBAL_DEFAULT);
    HttpClientApi api(nullptr, false);
    api.setReplyTimer(2);
    api.setSSLConfig(arguments[2], arguments[3], arguments[4]);
    BareClient bare(arguments);

    QString reply;
    const auto client = [&] { return static_cast<long>(api.getRequest(reply, arguments[1], QString(), true)); };
    const auto curl = [&] { return bare.get(); };
    // The very first connection of all warms the library and the server up.
    timed([&] { return BareClient(arguments).get(); });
    const double firstClient = timed(client);
    const double firstCurl = timed(curl);
    std::vector<double> clientTimes;
    std::vector<double> curlTimes;
    for (int i = 0; i < arguments[5].toInt(); ++i) {
        clientTimes.push_back(timed(client));
        curlTimes.push_back(timed(curl));
    }
    QTextStream(stdout) << firstClient << ' ' << median(clientTimes) << ' ' << firstCurl << ' ' << median(curlTimes)
                        << '\n';
    return 0;
}

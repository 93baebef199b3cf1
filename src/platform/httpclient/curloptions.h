#pragma once

#include <QByteArray>
#include <QString>

#include <curl/curl.h>

#include <memory>

/// What a request sets on a curl handle.
namespace zent::http
{

constexpr long kConnectTimeoutMs = 1500;

struct Request {
    QByteArray method;
    QByteArray url;
    QByteArray body;
};

struct SslConfig {
    QString ca;
    QString cert;
    QString key;
};

struct ListDeleter {
    void operator()(curl_slist* list) const { curl_slist_free_all(list); }
};
using HeaderList = std::unique_ptr<curl_slist, ListDeleter>;

/// Sets options of a handle and remembers the first failure, so that a request never leaves with a check missing.
class OptionSetter
{
public:
    explicit OptionSetter(CURL* handle) : m_handle(handle) {}

    template <typename Value>
    void set(CURLoption option, Value value)
    {
        if (m_result == CURLE_OK)
            m_result = curl_easy_setopt(m_handle, option, value);
    }
    CURLcode result() const { return m_result; }

private:
    CURL* m_handle;
    CURLcode m_result = CURLE_OK;
};

/// The header lines that differ from curl's own; null when memory is short. A name without a value, in `contentType`,
/// too, keeps the header away.
HeaderList makeHeaders(const char* contentType);

/// Bounds time and size.
void setLimits(OptionSetter& options, long timeoutMs);

/// Keeps everything away that the environment or a reply could bring in.
void setConfinement(OptionSetter& options);

/// Whom to trust and as whom to appear.
void setTls(OptionSetter& options, const SslConfig& ssl);

/// What is sent; `request` and `headers` must outlive the transfer.
void setMessage(OptionSetter& options, const Request& request, const curl_slist* headers);

} // namespace zent::http

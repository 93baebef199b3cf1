#include "curloptions.h"

#include "replylimit.h"

#include <QFile>

#include <algorithm>

namespace zent::http
{

namespace
{

bool appendHeader(HeaderList& list, const char* header)
{
    curl_slist* extended = curl_slist_append(list.get(), header);
    if (extended == nullptr)
        return false;
    static_cast<void>(list.release());
    list.reset(extended);
    return true;
}

} // namespace

HeaderList makeHeaders(const char* contentType)
{
    HeaderList list;
    if (!appendHeader(list, contentType) || !appendHeader(list, "Expect:"))
        return nullptr;
    return list;
}

void setLimits(OptionSetter& options, long timeoutMs)
{
    options.set(CURLOPT_TIMEOUT_MS, timeoutMs);
    options.set(CURLOPT_CONNECTTIMEOUT_MS, std::min(timeoutMs, kConnectTimeoutMs));
    options.set(CURLOPT_NOSIGNAL, 1L);
    // Without it a handle waits for its resolver thread, however long the name server stays silent.
    options.set(CURLOPT_QUICK_EXIT, 1L);
    options.set(CURLOPT_MAXFILESIZE_LARGE, static_cast<curl_off_t>(kMaxReplyBytes));
}

void setConfinement(OptionSetter& options)
{
    options.set(CURLOPT_PROTOCOLS_STR, "http,https");
    options.set(CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
    options.set(CURLOPT_FOLLOWLOCATION, 0L);
    options.set(CURLOPT_PROXY, "");
    options.set(CURLOPT_NETRC, static_cast<long>(CURL_NETRC_IGNORED));
}

void setTls(OptionSetter& options, const SslConfig& ssl)
{
    const auto pathOrNull = [](const QByteArray& path) { return path.isEmpty() ? nullptr : path.constData(); };
    options.set(CURLOPT_SSLVERSION, static_cast<long>(CURL_SSLVERSION_TLSv1_2));
    options.set(CURLOPT_SSL_VERIFYPEER, 1L);
    options.set(CURLOPT_SSL_VERIFYHOST, 2L);
    // Both default to the system's authorities.
    options.set(CURLOPT_CAPATH, static_cast<const char*>(nullptr));
    options.set(CURLOPT_CAINFO, pathOrNull(QFile::encodeName(ssl.ca)));
    options.set(CURLOPT_SSLCERT, pathOrNull(QFile::encodeName(ssl.cert)));
    options.set(CURLOPT_SSLKEY, pathOrNull(QFile::encodeName(ssl.key)));
    // An encrypted key fails; without a pass phrase it would be asked for on the terminal.
    options.set(CURLOPT_KEYPASSWD, "");
}

void setMessage(OptionSetter& options, const Request& request, const curl_slist* headers)
{
    options.set(CURLOPT_URL, request.url.constData());
    options.set(CURLOPT_HTTPHEADER, headers);
    if (request.method == "POST" || !request.body.isEmpty()) {
        options.set(CURLOPT_POSTFIELDS, request.body.constData());
        options.set(CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(request.body.size()));
        options.set(CURLOPT_CUSTOMREQUEST, request.method.constData());
    } else {
        options.set(CURLOPT_CUSTOMREQUEST, static_cast<const char*>(nullptr));
        options.set(CURLOPT_POSTFIELDS, static_cast<const char*>(nullptr));
        options.set(CURLOPT_HTTPGET, 1L);
    }
}

} // namespace zent::http

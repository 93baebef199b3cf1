#include "httpclientapi.h"

#include <QDateTime>
#include <QDebug>
#include <QFile>
#include <QFileInfo>
#include <QUrl>

#include <curl/curl.h>

#include <algorithm>
#include <array>
#include <climits>
#include <csignal>
#include <ctime>

namespace
{

constexpr long kConnectTimeoutMs = 1500;
constexpr curl_off_t kMaxReplyBytes = 16 * 1024 * 1024;

struct EasyDeleter {
    void operator()(CURL* handle) const { curl_easy_cleanup(handle); }
};
using EasyHandle = std::unique_ptr<CURL, EasyDeleter>;

struct ListDeleter {
    void operator()(curl_slist* list) const { curl_slist_free_all(list); }
};
using HeaderList = std::unique_ptr<curl_slist, ListDeleter>;

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

/// Keeps SIGPIPE from the calling thread: CURLOPT_NOSIGNAL leaves it to the caller, and a TLS library may write to a
/// connection that the server has closed.
class SigpipeBlocker
{
public:
    SigpipeBlocker()
    {
        sigemptyset(&m_sigpipe);
        sigaddset(&m_sigpipe, SIGPIPE);
        sigset_t pending;
        sigpending(&pending);
        m_wasPending = sigismember(&pending, SIGPIPE) == 1;
        pthread_sigmask(SIG_BLOCK, &m_sigpipe, &m_previous);
    }
    ~SigpipeBlocker()
    {
        const timespec now{};
        if (!m_wasPending)
            sigtimedwait(&m_sigpipe, nullptr, &now);
        pthread_sigmask(SIG_SETMASK, &m_previous, nullptr);
    }
    Q_DISABLE_COPY(SigpipeBlocker)

private:
    sigset_t m_sigpipe{};
    sigset_t m_previous{};
    bool m_wasPending = false;
};

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

/// A reply as it comes in.
struct ReplyBuffer {
    QByteArray body;
    bool headComplete = false;
    bool tooLarge = false;

    static size_t appendBody(char* bytes, size_t size, size_t count, void* self)
    {
        auto* buffer = static_cast<ReplyBuffer*>(self);
        const size_t length = size * count;
        if (static_cast<size_t>(buffer->body.size()) + length > static_cast<size_t>(kMaxReplyBytes)) {
            buffer->tooLarge = true;
            return 0;
        }
        buffer->body.append(bytes, static_cast<int>(length));
        return length;
    }

    /// The empty line ends a head. Another head may follow that of an interim reply, and trailer lines a chunked body.
    static size_t noteHeader(char* bytes, size_t size, size_t count, void* self)
    {
        const QByteArray line = QByteArray::fromRawData(bytes, static_cast<int>(size * count));
        bool& complete = static_cast<ReplyBuffer*>(self)->headComplete;
        complete = line == "\r\n" || line == "\n" || (complete && !line.startsWith("HTTP/"));
        return size * count;
    }
};

bool initializeCurl()
{
    static const bool initialized = [] {
        if (curl_global_init(CURL_GLOBAL_DEFAULT) != CURLE_OK)
            return false;
        const curl_version_info_data* version = curl_version_info(CURLVERSION_NOW);
        if ((version->features & CURL_VERSION_ASYNCHDNS) == 0)
            qWarning() << "libcurl resolves host names synchronously: a silent name server delays requests beyond "
                          "their time limit";
        return true;
    }();
    return initialized;
}

/// The URL as it may be shown in the log: queries hold user names.
QString logUrl(const QString& url)
{
    const QUrl parsed(url);
    if (!parsed.isValid())
        return url.section(QLatin1Char('?'), 0, 0);
    return parsed.toString(QUrl::RemoveQuery | QUrl::RemoveFragment | QUrl::RemoveUserInfo);
}

/// The URL in the form curl takes; empty when it is no absolute one.
QByteArray encodeUrl(const QString& url)
{
    QUrl parsed(url);
    if (!parsed.isValid() || parsed.host().isEmpty())
        return {};
    if (parsed.port() == 0)
        parsed.setPort(-1);
    return parsed.toEncoded(QUrl::RemoveFragment);
}

bool appendHeader(HeaderList& list, const char* header)
{
    curl_slist* extended = curl_slist_append(list.get(), header);
    if (extended == nullptr)
        return false;
    static_cast<void>(list.release());
    list.reset(extended);
    return true;
}

/// The header lines that differ from curl's own; null when memory is short. A name without a value keeps it away.
HeaderList makeHeaders(const Request& request)
{
    HeaderList list;
    const char* contentType = request.body.isEmpty() ? "Content-Type:" : "Content-Type: application/json";
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
    options.set(CURLOPT_MAXFILESIZE_LARGE, kMaxReplyBytes);
}

/// Keeps everything away that the environment or a reply could bring in.
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
        options.set(CURLOPT_HTTPGET, 1L);
    }
}

} // namespace

/// The reused handle and the configuration of its requests.
class HttpClientApi::Session
{
public:
    Session() = default;
    ~Session() { dropConnections(); }
    Q_DISABLE_COPY(Session)

    void setTimeout(int seconds)
    {
        m_timeoutMs = std::clamp(seconds * 1000LL, 1000LL, static_cast<long long>(INT_MAX));
    }
    void setSsl(const SslConfig& ssl) { m_ssl = ssl; }
    int send(QString& reply, const QByteArray& method, const QString& url, const QString& body);

private:
    CURLcode perform(const Request& request, QByteArray& reply, long& status);
    CURLcode prepare(const Request& request, const curl_slist* headers, ReplyBuffer& buffer);
    QString sslFingerprint() const;
    bool openHandle();
    void dropConnections();

    EasyHandle m_handle;
    SslConfig m_ssl;
    QString m_fingerprint;
    long m_timeoutMs = 2000;
    std::array<char, CURL_ERROR_SIZE> m_error{};
};

int HttpClientApi::Session::send(QString& reply, const QByteArray& method, const QString& url, const QString& body)
{
    const SigpipeBlocker blocker;
    const Request request{method, encodeUrl(url), body.toUtf8()};
    QByteArray data;
    long status = 0;
    m_error[0] = '\0';
    const CURLcode result = perform(request, data, status);
    if (result != CURLE_OK) {
        reply.clear();
        qWarning() << method.constData() << logUrl(url)
                   << "failed:" << (m_error[0] != '\0' ? m_error.data() : curl_easy_strerror(result));
        return -static_cast<int>(result);
    }
    reply = QString::fromUtf8(data);
    return static_cast<int>(status);
}

CURLcode HttpClientApi::Session::perform(const Request& request, QByteArray& reply, long& status)
{
    if (request.url.isEmpty())
        return CURLE_URL_MALFORMAT;
    if (!openHandle())
        return CURLE_FAILED_INIT;
    const HeaderList headers = makeHeaders(request);
    if (!headers)
        return CURLE_OUT_OF_MEMORY;

    ReplyBuffer buffer;
    CURLcode result = prepare(request, headers.get(), buffer);
    if (result == CURLE_OK)
        result = curl_easy_perform(m_handle.get());
    if (result == CURLE_OK)
        result = curl_easy_getinfo(m_handle.get(), CURLINFO_RESPONSE_CODE, &status);
    // For curl a reply that ends in its head is a complete one with an empty body.
    if (result == CURLE_OK && !buffer.headComplete)
        result = CURLE_PARTIAL_FILE;
    if (buffer.tooLarge) {
        m_error[0] = '\0';
        result = CURLE_FILESIZE_EXCEEDED;
    }
    // The handle outlives what the options point to.
    curl_easy_reset(m_handle.get());
    reply = buffer.body;
    return result;
}

CURLcode HttpClientApi::Session::prepare(const Request& request, const curl_slist* headers, ReplyBuffer& buffer)
{
    OptionSetter options(m_handle.get());
    options.set(CURLOPT_ERRORBUFFER, m_error.data());
    setLimits(options, m_timeoutMs);
    setConfinement(options);
    setTls(options, m_ssl);
    setMessage(options, request, headers);
    options.set(CURLOPT_WRITEFUNCTION, &ReplyBuffer::appendBody);
    options.set(CURLOPT_WRITEDATA, &buffer);
    options.set(CURLOPT_HEADERFUNCTION, &ReplyBuffer::noteHeader);
    options.set(CURLOPT_HEADERDATA, &buffer);
    return options.result();
}

/// Changes whenever a file of the SSL configuration is named, written or removed.
QString HttpClientApi::Session::sslFingerprint() const
{
    QString text;
    for (const QString& path : {m_ssl.ca, m_ssl.cert, m_ssl.key}) {
        const QFileInfo info(path);
        text += path + QLatin1Char('\n');
        if (!path.isEmpty() && info.exists())
            text += QString::number(info.lastModified().toMSecsSinceEpoch()) + QLatin1Char(' ') +
                    QString::number(info.size()) + QLatin1Char('\n');
    }
    return text;
}

/// A kept connection was made with the files as they were then, and curl holds on to the authorities it has read; both
/// end with the handle.
bool HttpClientApi::Session::openHandle()
{
    const QString fingerprint = sslFingerprint();
    if (fingerprint != m_fingerprint)
        dropConnections();
    m_fingerprint = fingerprint;
    if (!m_handle && initializeCurl())
        m_handle.reset(curl_easy_init());
    return m_handle != nullptr;
}

void HttpClientApi::Session::dropConnections()
{
    const SigpipeBlocker blocker;
    m_handle.reset();
}

HttpClientApi::HttpClientApi(QObject* parent, bool reserved) : QObject(parent), m_session(std::make_unique<Session>())
{
    Q_UNUSED(reserved)
}

HttpClientApi::~HttpClientApi() = default;

void HttpClientApi::setReplyTimer(const int& seconds)
{
    m_session->setTimeout(seconds);
}

void HttpClientApi::setSSLConfig(const QString& ca, const QString& cert, const QString& key)
{
    m_session->setSsl({ca, cert, key});
}

int HttpClientApi::getRequest(QString& reply, const QString& url, const QString& body, bool reserved)
{
    Q_UNUSED(reserved)
    return m_session->send(reply, QByteArrayLiteral("GET"), url, body);
}

int HttpClientApi::postRequest(QString& reply, const QString& url, const QString& body, bool reserved)
{
    Q_UNUSED(reserved)
    return m_session->send(reply, QByteArrayLiteral("POST"), url, body);
}

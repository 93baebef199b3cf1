#include "httpclientapi.h"

#include "curloptions.h"
#include "hostguard.h"
#include "replylimit.h"

#include <QDebug>
#include <QFile>
#include <QUrl>

#include <curl/curl.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <csignal>
#include <ctime>
#include <map>

#include <sys/stat.h>

namespace
{

using zent::http::HeaderList;
using zent::http::kMaxReplyBytes;
using zent::http::OptionSetter;
using zent::http::Request;
using zent::http::SslConfig;

/// A failure without a connection that took this long has cost the caller as much as a time-out.
constexpr curl_off_t kLongWaitUs = 1'000'000;

struct EasyDeleter {
    void operator()(CURL* handle) const { curl_easy_cleanup(handle); }
};
using EasyHandle = std::unique_ptr<CURL, EasyDeleter>;

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

/// The URL without port 0, which stands for the default port; empty when it is no absolute one.
QUrl absoluteUrl(const QString& url)
{
    QUrl parsed(url);
    if (!parsed.isValid() || parsed.host().isEmpty())
        return {};
    if (parsed.port() == 0)
        parsed.setPort(-1);
    return parsed;
}

/// What the request that has just ended says about its host.
HostGuard::Outcome outcomeOf(CURL* handle, CURLcode result)
{
    if (result == CURLE_OK)
        return HostGuard::Outcome::Answered;
    curl_off_t connectedUs = 0;
    curl_off_t readyUs = 0;
    curl_off_t totalUs = 0;
    long error = 0;
    curl_easy_getinfo(handle, CURLINFO_CONNECT_TIME_T, &connectedUs);
    curl_easy_getinfo(handle, CURLINFO_PRETRANSFER_TIME_T, &readyUs);
    curl_easy_getinfo(handle, CURLINFO_TOTAL_TIME_T, &totalUs);
    curl_easy_getinfo(handle, CURLINFO_OS_ERRNO, &error);
    // A kept connection has no time of connecting, one that waits for the TLS handshake none of readiness.
    if (connectedUs > 0 || readyUs > 0)
        return result == CURLE_OPERATION_TIMEDOUT ? HostGuard::Outcome::ReplyTimedOut : HostGuard::Outcome::Met;
    // The resolver may give a silent name server up before the request's own time is over.
    if (result == CURLE_OPERATION_TIMEDOUT || totalUs >= kLongWaitUs)
        return HostGuard::Outcome::ConnectTimedOut;
    return error == ECONNREFUSED ? HostGuard::Outcome::Met : HostGuard::Outcome::Unknown;
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
        m_configured = false;
    }
    void setSsl(const SslConfig& ssl)
    {
        m_ssl = ssl;
        m_configured = false;
    }
    int send(QString& reply, const QByteArray& method, const QString& url, const QString& body);

private:
    HostGuard& guardOf(const QUrl& url);
    CURLcode perform(const Request& request, QByteArray& reply, long& status);
    CURLcode prepare(const Request& request, ReplyBuffer& buffer);
    void configure(OptionSetter& options);
    QByteArray sslFingerprint() const;
    bool openHandle();
    void dropConnections();

    EasyHandle m_handle;
    const HeaderList m_headers = zent::http::makeHeaders("Content-Type:");
    const HeaderList m_jsonHeaders = zent::http::makeHeaders("Content-Type: application/json");
    std::map<QString, std::unique_ptr<HostGuard>> m_guards;
    SslConfig m_ssl;
    QByteArray m_fingerprint;
    /// Whether the handle has the options that all requests share.
    bool m_configured = false;
    long m_timeoutMs = 2000;
    std::array<char, CURL_ERROR_SIZE> m_error{};
    HostGuard::Outcome m_outcome = HostGuard::Outcome::Unknown;
};

int HttpClientApi::Session::send(QString& reply, const QByteArray& method, const QString& url, const QString& body)
{
    const QUrl absolute = absoluteUrl(url);
    HostGuard& guard = guardOf(absolute);
    const QString objection = method == "GET" ? guard.objection() : QString();
    if (!objection.isEmpty()) {
        reply.clear();
        qWarning() << method.constData() << logUrl(url) << "not sent:" << qPrintable(objection);
        return -guard.failure();
    }
    const SigpipeBlocker blocker;
    QByteArray data;
    long status = 0;
    m_error[0] = '\0';
    m_outcome = HostGuard::Outcome::Unknown;
    const CURLcode result = perform({method, absolute.toEncoded(QUrl::RemoveFragment), body.toUtf8()}, data, status);
    guard.note(m_outcome, result);
    if (result != CURLE_OK) {
        reply.clear();
        qWarning() << method.constData() << logUrl(url)
                   << "failed:" << (m_error[0] != '\0' ? m_error.data() : curl_easy_strerror(result));
        return -static_cast<int>(result);
    }
    reply = QString::fromUtf8(data);
    return static_cast<int>(status);
}

HostGuard& HttpClientApi::Session::guardOf(const QUrl& url)
{
    const int port = url.port(url.scheme() == QLatin1String("https") ? 443 : 80);
    std::unique_ptr<HostGuard>& guard = m_guards[url.host() + QLatin1Char(':') + QString::number(port)];
    if (!guard)
        guard = std::make_unique<HostGuard>(url.host(), static_cast<quint16>(port));
    return *guard;
}

CURLcode HttpClientApi::Session::perform(const Request& request, QByteArray& reply, long& status)
{
    if (request.url.isEmpty())
        return CURLE_URL_MALFORMAT;
    if (!openHandle())
        return CURLE_FAILED_INIT;
    if (!m_headers || !m_jsonHeaders)
        return CURLE_OUT_OF_MEMORY;

    ReplyBuffer buffer;
    CURLcode result = prepare(request, buffer);
    if (result == CURLE_OK) {
        result = curl_easy_perform(m_handle.get());
        m_outcome = outcomeOf(m_handle.get(), result);
    }
    if (result == CURLE_OK)
        result = curl_easy_getinfo(m_handle.get(), CURLINFO_RESPONSE_CODE, &status);
    // For curl a reply that ends in its head is a complete one with an empty body.
    if (result == CURLE_OK && !buffer.headComplete)
        result = CURLE_PARTIAL_FILE;
    if (buffer.tooLarge) {
        m_error[0] = '\0';
        result = CURLE_FILESIZE_EXCEEDED;
    }
    reply = buffer.body;
    return result;
}

/// Sets what one request needs, and what all share where that is new. What the former request's options point to is
/// gone; each of them is set anew here.
CURLcode HttpClientApi::Session::prepare(const Request& request, ReplyBuffer& buffer)
{
    OptionSetter options(m_handle.get());
    if (!m_configured)
        configure(options);
    setMessage(options, request, (request.body.isEmpty() ? m_headers : m_jsonHeaders).get());
    options.set(CURLOPT_WRITEDATA, &buffer);
    options.set(CURLOPT_HEADERDATA, &buffer);
    m_configured = options.result() == CURLE_OK;
    return options.result();
}

void HttpClientApi::Session::configure(OptionSetter& options)
{
    options.set(CURLOPT_ERRORBUFFER, m_error.data());
    setLimits(options, m_timeoutMs);
    setConfinement(options);
    setTls(options, m_ssl);
    options.set(CURLOPT_WRITEFUNCTION, &ReplyBuffer::appendBody);
    options.set(CURLOPT_HEADERFUNCTION, &ReplyBuffer::noteHeader);
}

/// Changes whenever a file of the SSL configuration is named, written, replaced or removed.
QByteArray HttpClientApi::Session::sslFingerprint() const
{
    QByteArray bytes;
    for (const QString& path : {m_ssl.ca, m_ssl.cert, m_ssl.key}) {
        const QByteArray name = QFile::encodeName(path);
        bytes += name + '\0';
        struct stat status = {};
        if (path.isEmpty() || stat(name.constData(), &status) != 0)
            continue;
        for (const auto number :
             {static_cast<qint64>(status.st_mtim.tv_sec), static_cast<qint64>(status.st_mtim.tv_nsec),
              static_cast<qint64>(status.st_size), static_cast<qint64>(status.st_ino)})
            bytes.append(reinterpret_cast<const char*>(&number), sizeof number);
    }
    return bytes;
}

/// A kept connection was made with the files as they were then, and curl holds on to the authorities it has read; both
/// end with the handle.
bool HttpClientApi::Session::openHandle()
{
    const QByteArray fingerprint = sslFingerprint();
    if (fingerprint != m_fingerprint)
        dropConnections();
    m_fingerprint = fingerprint;
    if (!m_handle && initializeCurl()) {
        m_handle.reset(curl_easy_init());
        m_configured = false;
    }
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

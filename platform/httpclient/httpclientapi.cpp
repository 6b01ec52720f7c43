#include "httpclientapi.h"

#include <QFile>
#include <QtDebug>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>

#include <array>
#include <limits>
#include <optional>

#include "curl_library.h"
#include "private_descriptors.h"
#include "reception.h"

namespace {

constexpr long kConnectLimitMs = 10'000;
constexpr long kTotalLimitMs = 30'000;
constexpr long kHttpVersion = CURL_HTTP_VERSION_1_1; // an enumerator or a long, by the library's version

// The kernel probes an idle connection, and drops the connection when a probe or a request is not
// acknowledged for 10 s. So a dead path is usually noticed before the next request, and otherwise leaves time
// for a new connection.
constexpr long kProbeAfterSeconds = 40;
constexpr long kProbeEverySeconds = 10;
constexpr unsigned int kUnansweredLimitMs = 10'000;

template <bool (Reception::*add)(const QByteArray&)>
size_t receive(char* data, size_t, size_t size, void* reception)
{
    const QByteArray part = QByteArray::fromRawData(data, static_cast<int>(size));
    return (static_cast<Reception*>(reception)->*add)(part) ? size : CURL_WRITEFUNC_ERROR;
}

// libcurl's own sockets would be inherited by every child process.
curl_socket_t openSocket(void*, curlsocktype, curl_sockaddr* address)
{
    const int opened = socket(address->family, address->socktype | SOCK_CLOEXEC, address->protocol);
    setsockopt(opened, IPPROTO_TCP, TCP_USER_TIMEOUT, &kUnansweredLimitMs, sizeof kUnansweredLimitMs);
    return opened;
}

/// A hung lookup is abandoned together with a descriptor of its own.
int beginLookup(void*, void*, void* lookup)
{
    static_cast<std::optional<PrivateDescriptors>*>(lookup)->emplace();
    return 0;
}

/// Percent-encodes, as UTF-8, the characters that a request line cannot carry; QUrl would alter others, too.
/// "#" is included: a server never receives what follows it, the fragment.
QByteArray encodedUrl(const QString& url)
{
    static const QByteArray alsoKept("!\"$%&'()*+,/:;<=>?@[\\]^`{|}"); // letters and digits are kept anyway
    return url.toUtf8().toPercentEncoding(alsoKept);
}

/// One request, on a handle of its own: a reused handle reads freed memory when the next response begins with
/// a folded header line (seen in libcurl 7.88). What is worth keeping lives in `multi` and `share`: an easy
/// handle without a multi handle creates one and opens a pair of sockets for each request.
class Exchange
{
public:
    Exchange(CURLM* multi, CURLSH* share)
        : m_multi(multi)
    {
        Q_CHECK_PTR(m_curl);
        set(CURLOPT_SHARE, share);
    }

    void setTransport()
    {
        set(CURLOPT_PROTOCOLS_STR, "https");
        // HTTP/2 would lower-case the header names, which callers compare with their case.
        set(CURLOPT_HTTP_VERSION, kHttpVersion);
        set(CURLOPT_FOLLOWLOCATION, 0L);
        set(CURLOPT_PROXY, ""); // nor one from the environment
        set(CURLOPT_CONNECTTIMEOUT_MS, kConnectLimitMs);
        set(CURLOPT_TIMEOUT_MS, kTotalLimitMs);
        set(CURLOPT_NOSIGNAL, 1L);
        set(CURLOPT_QUICK_EXIT, 1L); // abandon a hung name lookup at the time limit
        set(CURLOPT_RESOLVER_START_FUNCTION, beginLookup);
        set(CURLOPT_RESOLVER_START_DATA, &m_lookup);
        set(CURLOPT_OPENSOCKETFUNCTION, openSocket);
        setKeeping();
    }

    void setTls(const QByteArray& caCert, const QByteArray& clientCert, const QByteArray& clientKey)
    {
        set(CURLOPT_SSLVERSION, static_cast<long>(CURL_SSLVERSION_TLSv1_2));
        set(CURLOPT_SSL_VERIFYPEER, 1L);
        set(CURLOPT_SSL_VERIFYHOST, 2L);
        set(CURLOPT_CAINFO, caCert.constData());
        set(CURLOPT_CAPATH, nullptr); // not the system's trusted authorities, which are the default
        set(CURLOPT_CA_CACHE_TIMEOUT, 0L); // reread the file, which may be replaced at any time
        if (!clientCert.isEmpty()) {
            set(CURLOPT_SSLCERT, clientCert.constData());
        }
        if (!clientKey.isEmpty()) {
            set(CURLOPT_SSLKEY, clientKey.constData());
        }
        set(CURLOPT_KEYPASSWD, ""); // fail on an encrypted key instead of asking for a password
    }

    void setRequest(const char* method, const QString& url)
    {
        set(CURLOPT_CUSTOMREQUEST, method);
        set(CURLOPT_URL, encodedUrl(url).constData());
        set(CURLOPT_PATH_AS_IS, 1L);
    }

    void setContent(const QByteArray& content, bool isJson)
    {
        addHeaderLine("Expect:"); // no round trip before a large body
        addHeaderLine(isJson && !content.isEmpty() ? "Content-Type: application/json" : "Content-Type:");
        set(CURLOPT_HTTPHEADER, m_headerLines.get());
        set(CURLOPT_POSTFIELDSIZE_LARGE, static_cast<curl_off_t>(content.size()));
        set(CURLOPT_COPYPOSTFIELDS, content.constData());
    }

    /// The response's status; 0 if there is none.
    int run()
    {
        set(CURLOPT_ERRORBUFFER, m_error.data());
        set(CURLOPT_WRITEFUNCTION, receive<&Reception::addBody>);
        set(CURLOPT_WRITEDATA, &m_reception);
        set(CURLOPT_HEADERFUNCTION, receive<&Reception::addHeaderLine>);
        set(CURLOPT_HEADERDATA, &m_reception);
        if (m_result == CURLE_OK) {
            m_result = perform();
        }
        long status = 0;
        if (m_result == CURLE_OK) {
            curl().easyGetinfo(m_curl.get(), CURLINFO_RESPONSE_CODE, &status);
        }
        return static_cast<int>(status);
    }

    [[nodiscard]] const Reception& reception() const { return m_reception; }

    [[nodiscard]] const char* failure() const
    {
        if (m_reception.refusal() != nullptr) {
            return m_reception.refusal();
        }
        return m_error.front() != '\0' ? m_error.data() : curl().easyStrerror(m_result);
    }

private:
    /// Reuses a connection as long as the server keeps it; by default libcurl drops it after 118 s without
    /// use.
    void setKeeping()
    {
        set(CURLOPT_MAXAGE_CONN, static_cast<long>(std::numeric_limits<int>::max()));
        set(CURLOPT_TCP_KEEPALIVE, 1L);
        set(CURLOPT_TCP_KEEPIDLE, kProbeAfterSeconds);
        set(CURLOPT_TCP_KEEPINTVL, kProbeEverySeconds);
    }

    CURLcode perform()
    {
        curl().multiAddHandle(m_multi, m_curl.get());
        CURLcode result = CURLE_FAILED_INIT;
        int running = 1;
        while (running > 0 && curl().multiPerform(m_multi, &running) == CURLM_OK && running > 0) {
            curl().multiPoll(m_multi, nullptr, 0, static_cast<int>(kTotalLimitMs), nullptr);
        }
        int left = 0;
        const auto* message = curl().multiInfoRead(m_multi, &left);
        if (message != nullptr && message->msg == CURLMSG_DONE) {
            result = message->data.result;
        }
        curl().multiRemoveHandle(m_multi, m_curl.get());
        return result;
    }

    // If libcurl has rejected a setting, nothing is sent.
    template <typename Value> void set(CURLoption option, Value value)
    {
        if (m_result == CURLE_OK) {
            m_result = curl().easySetopt(m_curl.get(), option, value);
        }
    }

    void addHeaderLine(const char* line)
    {
        m_headerLines.reset(curl().slistAppend(m_headerLines.release(), line));
    }

    CURLM* m_multi;
    CURLcode m_result = CURLE_OK;
    std::array<char, CURL_ERROR_SIZE> m_error{};
    std::unique_ptr<curl_slist, decltype(&curl_slist_free_all)> m_headerLines{nullptr, curl().slistFreeAll};
    Reception m_reception;
    std::optional<PrivateDescriptors> m_lookup; ///< from the start of a name lookup
    // The last member, so it is destroyed first: it points to the others.
    std::unique_ptr<CURL, decltype(&curl_easy_cleanup)> m_curl{curl().easyInit(), curl().easyCleanup};
};

CURLM* newMulti()
{
    const PrivateDescriptors withItsPipe;
    return curl().multiInit();
}

} // namespace

HttpClientApi::HttpClientApi(QObject* parent, bool)
    : QObject(parent)
    , m_share(curl().shareInit())
    , m_multi(newMulti())
{
    Q_CHECK_PTR(m_share);
    Q_CHECK_PTR(m_multi);
    curl().shareSetopt(m_share.get(), CURLSHOPT_SHARE, CURL_LOCK_DATA_SSL_SESSION);
}

HttpClientApi::~HttpClientApi() = default;

void HttpClientApi::setSSLConfig(const QString& caCert, const QString& clientCert, const QString& clientKey)
{
    m_caCert = QFile::encodeName(caCert);
    m_clientCert = QFile::encodeName(clientCert);
    m_clientKey = QFile::encodeName(clientKey);
}

int HttpClientApi::getRequest(QString& reply, const QString& url, const QString& body, bool isJson)
{
    return request("GET", reply, url, body, isJson);
}

int HttpClientApi::putRequest(QString& reply, const QString& url, const QString& body, bool isJson)
{
    return request("PUT", reply, url, body, isJson);
}

QList<QPair<QByteArray, QByteArray>> HttpClientApi::getRawHeader() const
{
    return m_rawHeaders;
}

void HttpClientApi::CloseShare::operator()(void* share) const
{
    curl().shareCleanup(share);
}

void HttpClientApi::CloseMulti::operator()(void* multi) const
{
    curl().multiCleanup(multi);
}

int HttpClientApi::request(const char* method, QString& reply, const QString& url, const QString& body,
                           bool isJson)
{
    Exchange exchange(m_multi.get(), m_share.get());
    exchange.setTransport();
    exchange.setTls(m_caCert, m_clientCert, m_clientKey);
    exchange.setRequest(method, url);
    // Without a body, a GET has no content and a PUT has content of length 0.
    if (!body.isEmpty() || qstrcmp(method, "GET") != 0) {
        exchange.setContent(body.toUtf8(), isJson);
    }

    const int status = exchange.run();
    if (status == 0) {
        qWarning("HTTP %s without a response: %s", method, exchange.failure());
    }
    m_rawHeaders = status == 0 ? Reception::Headers() : exchange.reception().headers();
    reply = status == 0 ? QString() : QString::fromUtf8(exchange.reception().body());
    return status;
}

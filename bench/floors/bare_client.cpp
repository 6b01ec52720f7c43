#include "bare_client.h"

namespace {

constexpr long kHttpVersion = CURL_HTTP_VERSION_1_1; // an enumerator or a long, by the library's version

} // namespace

BareClient::BareClient()
    : m_curl(curl_easy_init(), curl_easy_cleanup)
    , m_headers(curl_slist_append(nullptr, "Content-Type: application/json"), curl_slist_free_all)
{
    auto* curl = m_curl.get();
    curl_easy_setopt(curl, CURLOPT_HTTP_VERSION, kHttpVersion);
    curl_easy_setopt(curl, CURLOPT_SSLVERSION, static_cast<long>(CURL_SSLVERSION_TLSv1_2));
    curl_easy_setopt(curl, CURLOPT_CAINFO, "/etc/velk/clientapi_ca.crt");
    curl_easy_setopt(curl, CURLOPT_CAPATH, nullptr);
    curl_easy_setopt(curl, CURLOPT_SSLCERT, "/etc/velk/ZEF_Velk.pem");
    curl_easy_setopt(curl, CURLOPT_SSLKEY, "/etc/velk/.ZEF_Velk.key");
    curl_easy_setopt(curl, CURLOPT_WRITEFUNCTION, takeBody);
    curl_easy_setopt(curl, CURLOPT_WRITEDATA, this);
    curl_easy_setopt(curl, CURLOPT_HEADERFUNCTION, takeHeader);
    curl_easy_setopt(curl, CURLOPT_HEADERDATA, this);
}

int BareClient::get(const QByteArray& url, const QByteArray& body)
{
    request("GET", url, body);
    return m_unread;
}

void BareClient::put(const QByteArray& url, const QByteArray& body)
{
    request("PUT", url, body);
}

void BareClient::request(const char* method, const QByteArray& url, const QByteArray& body)
{
    auto* curl = m_curl.get();
    m_body.clear();
    m_unread = 0;
    curl_easy_setopt(curl, CURLOPT_URL, url.constData());
    if (body.isEmpty()) {
        curl_easy_setopt(curl, CURLOPT_HTTPGET, 1L);
        curl_easy_setopt(curl, CURLOPT_HTTPHEADER, nullptr);
    } else {
        curl_easy_setopt(curl, CURLOPT_HTTPHEADER, m_headers.get());
        curl_easy_setopt(curl, CURLOPT_POSTFIELDSIZE, static_cast<long>(body.size()));
        curl_easy_setopt(curl, CURLOPT_POSTFIELDS, body.constData());
    }
    curl_easy_setopt(curl, CURLOPT_CUSTOMREQUEST, method);
    curl_easy_perform(curl);
}

size_t BareClient::takeBody(char* data, size_t /*one*/, size_t size, void* client)
{
    static_cast<BareClient*>(client)->m_body.append(data, static_cast<int>(size));
    return size;
}

size_t BareClient::takeHeader(char* data, size_t /*one*/, size_t size, void* client)
{
    const QByteArray line = QByteArray::fromRawData(data, static_cast<int>(size));
    const QByteArray name("X-Total-Count:");
    if (line.startsWith(name)) {
        static_cast<BareClient*>(client)->m_unread = line.mid(name.size()).trimmed().toInt();
    }
    return size;
}

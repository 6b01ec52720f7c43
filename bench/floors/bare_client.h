#pragma once

#include <QByteArray>

#include <curl/curl.h>

#include <memory>

/// libcurl's easy interface with one handle for all requests to the platform; reads only the header with the
/// number of unread messages.
class BareClient
{
public:
    BareClient();

    /// Returns the number of unread messages in the reply, 0 if the reply has none.
    int get(const QByteArray& url, const QByteArray& body = {});
    void put(const QByteArray& url, const QByteArray& body);

    /// The body of the last reply.
    [[nodiscard]] const QByteArray& body() const { return m_body; }

private:
    void request(const char* method, const QByteArray& url, const QByteArray& body);
    static size_t takeBody(char* data, size_t one, size_t size, void* client);
    static size_t takeHeader(char* data, size_t one, size_t size, void* client);

    std::unique_ptr<CURL, decltype(&curl_easy_cleanup)> m_curl;
    std::unique_ptr<curl_slist, decltype(&curl_slist_free_all)> m_headers;
    QByteArray m_body;
    int m_unread = 0;
};

#include "canned_platform.h"

#include <utility>

#include "httpclientapi.h"

namespace {

CannedReply nextReply;
CannedReply lastReply;

} // namespace

void setNextReply(const CannedReply& reply)
{
    nextReply = reply;
}

// These go before the library's own, which the linker then leaves out.

HttpClientApi::HttpClientApi(QObject* parent, bool)
    : QObject(parent)
{ }

HttpClientApi::~HttpClientApi() = default;

void HttpClientApi::setSSLConfig(const QString&, const QString&, const QString&) { }

int HttpClientApi::getRequest(QString& reply, const QString&, const QString&, bool)
{
    lastReply = std::exchange(nextReply, {});
    reply = lastReply.body;
    return lastReply.status;
}

int HttpClientApi::putRequest(QString& reply, const QString& url, const QString& body, bool isJson)
{
    return getRequest(reply, url, body, isJson);
}

QList<QPair<QByteArray, QByteArray>> HttpClientApi::getRawHeader() const
{
    return lastReply.headers;
}

void HttpClientApi::CloseShare::operator()(void*) const { }

void HttpClientApi::CloseMulti::operator()(void*) const { }

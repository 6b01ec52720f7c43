#include "fuzzing.h"
#include "httpclientapi.h"
#include "https_server.h"

namespace {

/// A client of a server of its own. Kept until the process ends.
struct Road
{
    HttpsServer server;
    HttpClientApi client{nullptr, false};
};

Road& road()
{
    static auto* const made = new Road;
    return *made;
}

} // namespace

/// The bytes that a server sends as its reply.
void tryInput(const QByteArray& input)
{
    auto& [server, client] = road();
    client.setSSLConfig(server.file("ca"), server.file("client"), server.file("client-key"));
    const QByteArray end = input.endsWith('!') ? "break_off" : "close";
    const QByteArray path = "/bytes?end=" + end + "&hex=" + input.toHex();

    QString reply = QStringLiteral("what was there before");
    const int status = client.getRequest(reply, server.url("proper", path.constData()), QString(), true);
    server.forgetRequests();
    require(status >= 0, "a status is not negative");
    require(status != 0 || reply.isEmpty(), "without a response there is no body");
    require(status != 0 || client.getRawHeader().isEmpty(), "without a response there are no headers");
}

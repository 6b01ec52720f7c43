#include "fuzzing.h"
#include "httpclientapi.h"
#include "https_server.h"

/// The bytes that a server sends as its reply.
void tryInput(const QByteArray& input)
{
    // Kept until the process ends.
    static auto& server = *new HttpsServer;
    static auto& client = *new HttpClientApi(nullptr, false);
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

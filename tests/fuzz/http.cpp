#include "fuzzing.h"
#include "httpclientapi.h"
#include "https_server.h"
#include "raw_server.h"

namespace {

/// A client of a server of its own. Kept until the process ends, as the server's thread is.
struct Road
{
    HttpsServer files; ///< only for its certificates
    RawServer server{files.file("server"), files.file("server-key")};
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
    auto& [files, server, client] = road();
    client.setSSLConfig(files.file("ca"), files.file("client"), files.file("client-key"));
    server.setReply(input, input.endsWith('!'));

    QString reply = QStringLiteral("what was there before");
    const int status = client.getRequest(reply, server.url(), QString(), true);
    require(status >= 0, "a status is not negative");
    require(status != 0 || reply.isEmpty(), "without a response there is no body");
    require(status != 0 || client.getRawHeader().isEmpty(), "without a response there are no headers");
}

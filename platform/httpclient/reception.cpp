#include "reception.h"

namespace {

constexpr int kBodyCap = 8 * 1024 * 1024;
constexpr int kHeaderCap = 256 * 1024;

} // namespace

bool Reception::addBody(const QByteArray& part)
{
    if (m_body.size() + part.size() > kBodyCap) {
        m_refusal = "the body exceeds 8 MiB";
        return false;
    }
    m_body += part;
    return true;
}

bool Reception::addHeaderLine(const QByteArray& line)
{
    m_headerBytes += line.size();
    if (m_headerBytes > kHeaderCap) {
        m_refusal = "the headers exceed 256 KiB";
        return false;
    }
    if (m_inHeaders) {
        addHeader(line);
    } else if (line.startsWith("HTTP/")) {
        beginHeaders();
    }
    // Outside a header block, any other line is a trailer.
    return true;
}

void Reception::beginHeaders()
{
    m_headers.clear();
    m_inHeaders = true;
}

// Parsed here: libcurl's header iteration takes quadratic time, 20 s for the headers that the cap allows.
void Reception::addHeader(const QByteArray& line)
{
    const QByteArray content = line.trimmed();
    const bool folded = line.startsWith(' ') || line.startsWith('\t');
    if (folded && !m_headers.isEmpty()) {
        m_headers.last().second += ' ' + content;
    } else if (content.isEmpty()) {
        m_inHeaders = false;
    } else {
        const int colon = content.indexOf(':');
        m_headers.append({content.left(colon), content.mid(colon + 1).trimmed()});
    }
}

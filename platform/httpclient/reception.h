#pragma once

#include <QByteArray>
#include <QList>
#include <QPair>

/// The part of a reply that has arrived. Refuses what exceeds a cap, 8 MiB of body or 256 KiB of headers, and
/// then gives the reason.
class Reception
{
public:
    using Headers = QList<QPair<QByteArray, QByteArray>>;

    [[nodiscard]] const QByteArray& body() const { return m_body; }
    /// The last response's headers: an interim response has its own header block.
    [[nodiscard]] const Headers& headers() const { return m_headers; }
    /// The reason; null if nothing was refused.
    [[nodiscard]] const char* refusal() const { return m_refusal; }

    bool addBody(const QByteArray& part);
    bool addHeaderLine(const QByteArray& line);

private:
    void beginHeaders();
    void addHeader(const QByteArray& line);

    QByteArray m_body;
    Headers m_headers;
    int m_headerBytes = 0;
    bool m_inHeaders = false;
    const char* m_refusal = nullptr;
};

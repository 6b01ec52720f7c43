#include "certificate_file.h"

#include <QFile>

#include <openssl/err.h>
#include <openssl/pem.h>

#include <algorithm>
#include <ctime>

namespace velk::check {

namespace {

/// A whole file; `error` is the reason if it cannot be read.
QByteArray contentOf(const QString& path, QString& error)
{
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) {
        error = QStringLiteral("cannot be read (%1)").arg(file.errorString());
        return QByteArray();
    }
    return file.readAll();
}

std::unique_ptr<BIO, FreeOpenSsl> streamOf(const QByteArray& content)
{
    return std::unique_ptr<BIO, FreeOpenSsl>(BIO_new_mem_buf(content.constData(), content.size()));
}

/// Without this, OpenSSL would ask for a password on the terminal.
int noPassword(char* /*buffer*/, int /*size*/, int /*writing*/, void* /*data*/)
{
    return -1;
}

QDateTime timeOf(const ASN1_TIME* time)
{
    std::tm parts{};
    if (ASN1_TIME_to_tm(time, &parts) != 1) {
        return QDateTime();
    }
    return QDateTime::fromSecsSinceEpoch(timegm(&parts), Qt::UTC);
}

} // namespace

CertificateFile::CertificateFile(const QString& path)
{
    const QByteArray content = contentOf(path, error);
    if (!error.isEmpty()) {
        return;
    }
    const auto stream = streamOf(content);
    while (Certificate next{PEM_read_bio_X509(stream.get(), nullptr, noPassword, nullptr)}) {
        const QDateTime begin = timeOf(X509_get0_notBefore(next.get()));
        const QDateTime end = timeOf(X509_get0_notAfter(next.get()));
        validFrom = certificates.empty() ? begin : std::max(validFrom, begin);
        validUntil = certificates.empty() ? end : std::min(validUntil, end);
        certificates.push_back(std::move(next));
    }
    // OpenSSL reports the end of the file as an error, too.
    const bool endsProperly = ERR_GET_REASON(ERR_peek_last_error()) == PEM_R_NO_START_LINE;
    ERR_clear_error();
    if (certificates.empty() || !endsProperly) {
        error = QStringLiteral("holds no sound certificate in PEM form");
    }
}

KeyFile::KeyFile(const QString& path)
{
    const QByteArray content = contentOf(path, error);
    if (!error.isEmpty()) {
        return;
    }
    key.reset(PEM_read_bio_PrivateKey(streamOf(content).get(), nullptr, noPassword, nullptr));
    ERR_clear_error();
    if (!key) {
        error = QStringLiteral("holds no unencrypted private key in PEM form");
    }
}

} // namespace velk::check

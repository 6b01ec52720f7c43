#pragma once

#include <QDateTime>
#include <QString>

#include <openssl/evp.h>
#include <openssl/x509.h>

#include <memory>
#include <vector>

namespace velk::check {

struct FreeOpenSsl
{
    void operator()(X509* certificate) const { X509_free(certificate); }
    void operator()(EVP_PKEY* key) const { EVP_PKEY_free(key); }
    void operator()(BIO* stream) const { BIO_free(stream); }
};

using Certificate = std::unique_ptr<X509, FreeOpenSsl>;
using Key = std::unique_ptr<EVP_PKEY, FreeOpenSsl>;

// Read with OpenSSL, as the agent's HTTPS client does. Qt's classes skip a broken certificate silently,
// know no Ed25519 keys, and cannot say whether a key matches.

/// The certificates of a PEM file, the owner's own first. `error` is empty on success.
struct CertificateFile
{
    explicit CertificateFile(const QString& path);

    std::vector<Certificate> certificates;
    QDateTime validFrom; ///< when the last of them becomes valid
    QDateTime validUntil; ///< when the first of them expires
    QString error;
};

/// The private key of a PEM file. An encrypted one counts as unreadable, as the agent cannot ask for a
/// password.
struct KeyFile
{
    explicit KeyFile(const QString& path);

    Key key;
    QString error;
};

} // namespace velk::check

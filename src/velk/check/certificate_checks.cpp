#include "certificate_checks.h"

#include "certificate_file.h"
#include "constants.h"

namespace velk::check {

namespace {

constexpr int kEndsSoonDays = 30;

const QString kConsequence = QStringLiteral(": the agent cannot talk to the platform");

QString dayOf(const QDateTime& time)
{
    return time.date().toString(Qt::ISODate);
}

Finding checkCertificate(const QString& subject, const QString& path, const CertificateFile& file)
{
    const auto finding = [&](Grade grade, const QString& text) {
        return Finding{grade, subject, path + QLatin1Char(' ') + text};
    };
    const QDateTime now = QDateTime::currentDateTimeUtc();
    if (!file.error.isEmpty()) {
        return finding(Grade::Bad, file.error + kConsequence);
    }
    if (!(file.validFrom <= now)) {
        return finding(
            Grade::Bad,
            QStringLiteral("is not valid before %1; is the clock right?").arg(dayOf(file.validFrom)));
    }
    if (!(now < file.validUntil)) {
        return finding(Grade::Bad,
                       QStringLiteral("expired on %1").arg(dayOf(file.validUntil)) + kConsequence);
    }
    const QString until = QStringLiteral("valid until %1").arg(dayOf(file.validUntil));
    if (now.daysTo(file.validUntil) < kEndsSoonDays) {
        return finding(Grade::Warning, QStringLiteral("is only ") + until);
    }
    return finding(Grade::Good, QStringLiteral("is ") + until);
}

Finding checkKey(const KeyFile& file, const CertificateFile& certificate)
{
    const QString subject = QStringLiteral("terminal key");
    if (!file.error.isEmpty()) {
        return {Grade::Bad, subject, kPrivateKeyPath + QLatin1Char(' ') + file.error + kConsequence};
    }
    if (certificate.certificates.empty()) {
        return {Grade::Good, subject,
                kPrivateKeyPath + QStringLiteral(" can be read; there is no certificate to match")};
    }
    if (X509_check_private_key(certificate.certificates.front().get(), file.key.get()) != 1) {
        return {Grade::Bad, subject,
                kPrivateKeyPath + QStringLiteral(" does not match the terminal's certificate")
                    + kConsequence};
    }
    return {Grade::Good, subject, kPrivateKeyPath + QStringLiteral(" matches the terminal's certificate")};
}

} // namespace

Findings checkCertificates()
{
    const CertificateFile authority(kServerCertPath);
    const CertificateFile terminal(kPublicKeyPath);
    return {checkCertificate(QStringLiteral("platform authority"), kServerCertPath, authority),
            checkCertificate(QStringLiteral("terminal certificate"), kPublicKeyPath, terminal),
            checkKey(KeyFile(kPrivateKeyPath), terminal)};
}

} // namespace velk::check

#include <QCommandLineParser>
#include <QCoreApplication>

#include <iostream>

#include "captured_log.h"
#include "certificate_checks.h"
#include "environment_checks.h"
#include "file_checks.h"
#include "platform_check.h"
#include "report.h"
#include "service_checks.h"

namespace {

using namespace velk::check;

constexpr int kWrongUsage = 3; // apart from the results 0, 1 and 2

Findings checkAll()
{
    const CapturedLog log;
    const SessionUser user = SessionUser::current();
    Findings findings{checkUser(user)};
    findings += checkInformationFile(user);
    findings += checkMachineIdentifier();
    findings += checkRestoreFiles();
    if (user.isDomainUser) {
        findings += checkCertificates();
        findings += checkPlatform(user);
    } else {
        findings.append(
            {Grade::Good, QStringLiteral("platform"), QStringLiteral("not needed for a local user")});
    }
    findings += checkServices();
    findings += checkPackageTools();
    findings += checkAgent();
    return findings;
}

/// Whether the command line is valid. Shows help or version if asked for, and then ends the program.
bool readCommandLine(QCommandLineParser& parser, const QStringList& arguments)
{
    const QCommandLineOption help = parser.addHelpOption();
    const QCommandLineOption version = parser.addVersionOption();
    const bool understood = parser.parse(arguments) && parser.positionalArguments().isEmpty();
    if (understood && parser.isSet(help)) {
        parser.showHelp();
    }
    if (understood && parser.isSet(version)) {
        parser.showVersion();
    }
    return understood;
}

} // namespace

int main(int argc, char* argv[])
{
    QCoreApplication application(argc, argv);
    QCoreApplication::setApplicationName(QStringLiteral("velks-check"));
    QCoreApplication::setApplicationVersion(QStringLiteral(VELK_VERSION));

    QCommandLineParser parser;
    parser.setApplicationDescription(
        QStringLiteral("Checks whether the session agent velks can work in this session, and if not, why.\n"
                       "Changes nothing. Exit status: 0 good, 1 warnings, 2 bad, 3 wrong usage."));
    const QCommandLineOption json(QStringLiteral("json"), QStringLiteral("Report as JSON."));
    parser.addOption(json);
    if (!readCommandLine(parser, QCoreApplication::arguments())) {
        std::cerr << "velks-check: wrong usage; see velks-check --help\n";
        return kWrongUsage;
    }

    const Findings findings = checkAll();
    const QByteArray report = parser.isSet(json) ? jsonReport(findings) : textReport(findings);
    std::cout << report.constData();
    return static_cast<int>(overall(findings));
}

#include "report.h"

#include <QJsonArray>
#include <QJsonDocument>
#include <QJsonObject>

#include <algorithm>

namespace velk::check {

namespace {

constexpr int kMarkWidth = 9;

QString markOf(Grade grade)
{
    switch (grade) {
    case Grade::Good:
        return QStringLiteral("good");
    case Grade::Warning:
        return QStringLiteral("warning");
    case Grade::Bad:
        break;
    }
    return QStringLiteral("bad");
}

QString conclusionOf(Grade grade)
{
    switch (grade) {
    case Grade::Good:
        return QStringLiteral("The agent can do its work in this session.");
    case Grade::Warning:
        return QStringLiteral("The agent can do only part of its work in this session; see the warnings.");
    case Grade::Bad:
        break;
    }
    return QStringLiteral("The agent cannot do its work in this session; see the lines marked as bad.");
}

} // namespace

Grade overall(const Findings& findings)
{
    Grade worst = Grade::Good;
    for (const Finding& finding : findings) {
        worst = std::max(worst, finding.grade);
    }
    return worst;
}

QByteArray textReport(const Findings& findings)
{
    QString report;
    for (const Finding& finding : findings) {
        const QString mark = QLatin1Char('[') + markOf(finding.grade) + QLatin1Char(']');
        report += mark.leftJustified(kMarkWidth) + QLatin1Char(' ') + finding.subject + QStringLiteral(": ")
            + finding.text + QLatin1Char('\n');
    }
    return (report + conclusionOf(overall(findings)) + QLatin1Char('\n')).toUtf8();
}

QByteArray jsonReport(const Findings& findings)
{
    QJsonArray entries;
    for (const Finding& finding : findings) {
        entries.append(QJsonObject{{QStringLiteral("result"), markOf(finding.grade)},
                                   {QStringLiteral("subject"), finding.subject},
                                   {QStringLiteral("text"), finding.text}});
    }
    const QJsonObject report{{QStringLiteral("result"), markOf(overall(findings))},
                             {QStringLiteral("findings"), entries}};
    return QJsonDocument(report).toJson();
}

} // namespace velk::check

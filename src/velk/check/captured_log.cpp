#include "captured_log.h"

#include <QMessageLogContext>

namespace velk::check {

namespace {

QtMessageHandler previousHandler = nullptr;

QString& warning()
{
    static QString text;
    return text;
}

void capture(QtMsgType type, const QMessageLogContext& /*context*/, const QString& text)
{
    if (type == QtWarningMsg || type == QtCriticalMsg) {
        warning() = text;
    }
}

} // namespace

CapturedLog::CapturedLog()
{
    previousHandler = qInstallMessageHandler(capture);
}

CapturedLog::~CapturedLog()
{
    qInstallMessageHandler(previousHandler);
}

QString CapturedLog::lastWarning()
{
    return warning();
}

} // namespace velk::check

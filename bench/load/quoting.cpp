/// Quotes a policy of SIZE bytes for the log, COUNT times.
/// usage: bench_quoting SIZE COUNT

#include <QString>

#include "log_text.h"

int main(int argc, char* argv[])
{
    if (argc < 3) {
        return 1;
    }
    const QString frame = QStringLiteral(R"({"type":2001,"payload":{"text":"%1"}})");
    const QString policy = frame.arg(QString(QString::fromLatin1(argv[1]).toInt(), QLatin1Char('x')));
    for (int left = QString::fromLatin1(argv[2]).toInt(); left > 0; --left) {
        quoted(policy);
    }
    return 0;
}

#include <QDebug>
#include <QRandomGenerator>
#include <QTest>

#include <array>

#include "log_text.h"

namespace {

QString quotedByQt(const QString& text)
{
    QString result;
    QDebug(&result).nospace() << text;
    return result;
}

/// A text of any characters, unpaired surrogates included; those that a log line treats specially are
/// frequent.
QString anyText(QRandomGenerator& random)
{
    static const std::array<QString, 6> frequent{
        QStringLiteral("\"\\{}"),     QStringLiteral("abc 0123"),   QStringLiteral("\n\t\r\b\f\x01\x7f"),
        QStringLiteral("终端停用é×"), QStringLiteral("\U0001F600"), QStringLiteral("\u200b\ufeff\U000E0001"),
    };
    QString text;
    for (int parts = random.bounded(20); parts > 0; --parts) {
        if (random.bounded(4) == 0) {
            text += QChar(static_cast<ushort>(random.bounded(0x10000)));
        } else {
            const QString& from = frequent.at(static_cast<std::size_t>(random.bounded(6)));
            text += from.mid(random.bounded(from.size()), random.bounded(8));
        }
    }
    return text;
}

} // namespace

/// A long text in a log line.
class LogTextTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void isQuotedAsQtQuotesIt_data()
    {
        QTest::addColumn<QString>("text");
        QTest::newRow("null") << QString();
        QTest::newRow("empty") << QStringLiteral("");
        QTest::newRow("a policy") << QStringLiteral("{\"type\":1201,\"text\":\"当前终端 \\\"x\\\"\"}");
        QTest::newRow("control characters") << QStringLiteral("\x01\x1f\x7f\n");
        QTest::newRow("NUL") << QString(QLatin1Char('\0')) + QStringLiteral("f");
        QTest::newRow("half a pair, then letters") << QString(QChar(0xd83d)) + QStringLiteral("ab");
        QTest::newRow("only quotes") << QStringLiteral("\"\"\\\\");
    }

    void isQuotedAsQtQuotesIt()
    {
        QFETCH(QString, text);
        QCOMPARE(quoted(text), quotedByQt(text));
    }

    void anyTextIsQuotedAsQtQuotesIt()
    {
        constexpr quint32 seed = 20261122;
        QRandomGenerator random(seed);
        for (int i = 0; i < 20'000; ++i) {
            const QString text = anyText(random);
            QCOMPARE(quoted(text), quotedByQt(text));
        }
    }
};

QTEST_GUILESS_MAIN(LogTextTest)
#include "log_text_test.moc"

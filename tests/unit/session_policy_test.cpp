#include <QFile>
#include <QJsonArray>
#include <QMetaEnum>
#include <QtTest>

#include "session_policy.h"

using Action = SessionPolicy::Action;
using Audience = SessionPolicy::Audience;

namespace {

QJsonValue contractDefinitions()
{
    QFile file(QStringLiteral(VELK_SOURCE_DIR "/contracts/json/policy-message.schema.json"));
    const QByteArray text = file.open(QIODevice::ReadOnly) ? file.readAll() : QByteArray();
    return QJsonDocument::fromJson(text).object().value(QLatin1String("$defs"));
}

QJsonArray alternatives(const QJsonValue& definition)
{
    return definition[QLatin1String("anyOf")].toArray();
}

/// Calls use(audience, entry) for each code that the contract names as the agent's own.
template <typename Use> void forEachOwnCode(Use use)
{
    const QJsonValue definitions = contractDefinitions();
    const QJsonArray groups = alternatives(definitions[QLatin1String("ownCode")]);
    for (const QJsonValue& group : groups) {
        const QString audience = group[QLatin1String("$ref")].toString().section(QLatin1Char('/'), -1);
        const QJsonArray entries = alternatives(definitions[audience]);
        for (const QJsonValue& entry : entries) {
            use(audience, entry);
        }
    }
}

template <typename Enum> QString nameOf(Enum value)
{
    return QString::fromLatin1(QMetaEnum::fromType<Enum>().valueToKey(static_cast<int>(value)));
}

int codeOf(const QJsonValue& entry)
{
    return entry[QLatin1String("const")].toInt();
}

} // namespace

class SessionPolicyTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void codeAsksForWhatTheContractSays_data()
    {
        QTest::addColumn<int>("code");
        QTest::addColumn<QString>("audience");
        QTest::addColumn<QString>("action");
        QTest::addColumn<QString>("notice");
        forEachOwnCode([](const QString& audience, const QJsonValue& entry) {
            QTest::addRow("%d", codeOf(entry))
                << codeOf(entry) << audience << entry[QLatin1String("x-action")].toString()
                << entry[QLatin1String("x-notice")][QLatin1String("zh")].toString();
        });
    }

    void codeAsksForWhatTheContractSays()
    {
        QFETCH(int, code);
        QFETCH(QString, notice);
        const SessionPolicy policy = sessionPolicy(code);
        QTEST(nameOf(policy.audience), "audience");
        QTEST(nameOf(policy.action), "action");
        // The request for a password change has its text where it is shown.
        QCOMPARE(policy.text, policy.action == Action::RequestPasswordChange ? QString() : notice);
    }

    void everyOtherCodeIsForwarded()
    {
        QSet<int> ownCodes;
        forEachOwnCode([&](const QString&, const QJsonValue& entry) { ownCodes.insert(codeOf(entry)); });
        QVERIFY(!ownCodes.isEmpty());

        QList<int> codes{INT_MIN, -1, INT_MAX};
        for (int code = 0; code < 10000; ++code) {
            codes.append(code);
        }
        for (const int code : qAsConst(codes)) {
            const SessionPolicy policy = sessionPolicy(code);
            const bool isForwarded = policy.action == Action::Forward;
            QVERIFY2(isForwarded != ownCodes.contains(code), qPrintable(QString::number(code)));
            QVERIFY(!isForwarded || policy.audience == Audience::EverySession);
        }
    }

    void payloadWithoutPolicyIsIgnored_data()
    {
        QTest::addColumn<QString>("payload");
        QTest::newRow("empty") << QString();
        QTest::newRow("no JSON") << QStringLiteral("type=1201");
        QTest::newRow("null") << QStringLiteral("null");
        QTest::newRow("array") << QStringLiteral(R"([{"type":1201}])");
        QTest::newRow("object without type") << QStringLiteral(R"({"payload":{"type":1201}})");
        QTest::newRow("letter case of type") << QStringLiteral(R"({"Type":1201})");
        QTest::newRow("cut off") << QStringLiteral(R"({"type":1201)");
        QTest::newRow("text after the object") << QStringLiteral(R"({"type":1201} x)");
        // In Latin-1 the letter is one byte that is no UTF-8, which JSON has to be.
        QTest::newRow("Latin-1 letter") << QStringLiteral(R"({"type":1201,"name":"é"})");
        QTest::newRow("syntax broken by a question mark") << QStringLiteral(R"({"type":1201，"a":1})");
    }

    void payloadWithoutPolicyIsIgnored()
    {
        QFETCH(QString, payload);
        QVERIFY(!parsePolicyMessage(payload).has_value());
    }

    void typeIsReadFromObject()
    {
        const QJsonObject message =
            parsePolicyMessage(QStringLiteral(R"( {"type":1202,"payload":{"uid":7}} )"))
                .value_or(QJsonObject());
        QCOMPARE(message.value(QLatin1String("type")).toInt(), 1202);
    }

    void charactersOutsideLatin1BecomeQuestionMarks()
    {
        const QJsonObject message =
            parsePolicyMessage(QStringLiteral(R"({"type":5,"text":"停用a"})")).value_or(QJsonObject());
        QCOMPARE(message.value(QLatin1String("text")).toString(), QStringLiteral("??a"));
    }
};

QTEST_GUILESS_MAIN(SessionPolicyTest)
#include "session_policy_test.moc"

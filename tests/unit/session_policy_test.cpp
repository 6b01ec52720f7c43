#include <QtTest>

#include "session_policy.h"

using Action = SessionPolicy::Action;
using Audience = SessionPolicy::Audience;

Q_DECLARE_METATYPE(SessionPolicy::Action)
Q_DECLARE_METATYPE(SessionPolicy::Audience)

class SessionPolicyTest : public QObject
{
    Q_OBJECT

private Q_SLOTS:
    void codeSelectsActionAudienceAndText_data();
    void codeSelectsActionAudienceAndText();
    void otherCodesAreForwarded_data();
    void otherCodesAreForwarded();
    void payloadWithoutPolicyIsIgnored_data();
    void payloadWithoutPolicyIsIgnored();
    void typeIsReadFromObject();
    void charactersOutsideLatin1BecomeQuestionMarks();
};

void SessionPolicyTest::codeSelectsActionAudienceAndText_data()
{
    QTest::addColumn<int>("code");
    QTest::addColumn<Action>("action");
    QTest::addColumn<Audience>("audience");
    QTest::addColumn<QString>("text");

    QTest::newRow("domain exit") << 1200 << Action::LeaveDomain << Audience::EverySession
                                 << QStringLiteral("当前终端已被管理员退域，1分钟后强制重启");
    QTest::newRow("terminal disabled") << 1201 << Action::WarnThenLogOut << Audience::EverySession
                                       << QStringLiteral("当前终端已被管理员停用，1分钟后强制注销");
    QTest::newRow("account deleted") << 1202 << Action::WarnThenLogOut << Audience::AddressedDomainUser
                                     << QStringLiteral("您的帐号已被管理员删除，1分钟后强制注销");
    QTest::newRow("account disabled") << 1203 << Action::WarnThenLogOut << Audience::AddressedDomainUser
                                      << QStringLiteral("您的帐号已被管理员停用，1分钟后强制注销");
    QTest::newRow("shutdown notice") << 1300 << Action::Notify << Audience::EverySession
                                     << QStringLiteral("该终端1分钟后进行关机");
    QTest::newRow("reboot notice") << 1301 << Action::Notify << Audience::EverySession
                                   << QStringLiteral("该终端1分钟后进行重启");
    QTest::newRow("password change") << 1304 << Action::RequestPasswordChange << Audience::DomainUsers
                                     << QString();
}

void SessionPolicyTest::codeSelectsActionAudienceAndText()
{
    QFETCH(int, code);
    const SessionPolicy policy = sessionPolicy(code);
    QTEST(policy.action, "action");
    QTEST(policy.audience, "audience");
    QTEST(policy.text, "text");
}

void SessionPolicyTest::otherCodesAreForwarded_data()
{
    QTest::addColumn<int>("code");
    for (const int code : {0, -1, 5, 1199, 1204, 1299, 1302, 1303, 1305, INT_MAX, INT_MIN}) {
        QTest::addRow("%d", code) << code;
    }
}

void SessionPolicyTest::otherCodesAreForwarded()
{
    QFETCH(int, code);
    const SessionPolicy policy = sessionPolicy(code);
    QCOMPARE(policy.action, Action::Forward);
    QCOMPARE(policy.audience, Audience::EverySession);
}

void SessionPolicyTest::payloadWithoutPolicyIsIgnored_data()
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

void SessionPolicyTest::payloadWithoutPolicyIsIgnored()
{
    QFETCH(QString, payload);
    QVERIFY(!parsePolicyMessage(payload).has_value());
}

void SessionPolicyTest::typeIsReadFromObject()
{
    const auto message = parsePolicyMessage(QStringLiteral(R"( {"type":1202,"payload":{"uid":7}} )"));
    QVERIFY(message.has_value());
    QCOMPARE(message->value(QLatin1String("type")).toInt(), 1202);
}

void SessionPolicyTest::charactersOutsideLatin1BecomeQuestionMarks()
{
    const auto message = parsePolicyMessage(QStringLiteral(R"({"type":5,"text":"停用a"})"));
    QVERIFY(message.has_value());
    QCOMPARE(message->value(QLatin1String("text")).toString(), QStringLiteral("??a"));
}

QTEST_GUILESS_MAIN(SessionPolicyTest)
#include "session_policy_test.moc"

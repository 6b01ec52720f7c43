#include "session_policy.h"

#include <QHash>
#include <QJsonDocument>

SessionPolicy sessionPolicy(int code)
{
    using Action = SessionPolicy::Action;
    using Audience = SessionPolicy::Audience;

    static const QHash<int, SessionPolicy> policies{
        {1200,
         {Action::LeaveDomain, Audience::EverySession,
          QStringLiteral("当前终端已被管理员退域，1分钟后强制重启")}},
        {1201,
         {Action::WarnThenLogOut, Audience::EverySession,
          QStringLiteral("当前终端已被管理员停用，1分钟后强制注销")}},
        {1202,
         {Action::WarnThenLogOut, Audience::AddressedDomainUser,
          QStringLiteral("您的帐号已被管理员删除，1分钟后强制注销")}},
        {1203,
         {Action::WarnThenLogOut, Audience::AddressedDomainUser,
          QStringLiteral("您的帐号已被管理员停用，1分钟后强制注销")}},
        // Notify is no more than a notice: another program shuts down or reboots.
        {1300, {Action::Notify, Audience::EverySession, QStringLiteral("该终端1分钟后进行关机")}},
        {1301, {Action::Notify, Audience::EverySession, QStringLiteral("该终端1分钟后进行重启")}},
        {1304, {Action::RequestPasswordChange, Audience::DomainUsers, QString()}},
    };
    return policies.value(code);
}

std::optional<QJsonObject> parsePolicyMessage(const QString& payload)
{
    // Latin-1, not UTF-8: characters outside Latin-1 become question marks before parsing. All agents of a
    // fleet must read a message alike.
    QJsonParseError error{};
    const auto document = QJsonDocument::fromJson(payload.toLatin1(), &error);
    if (error.error != QJsonParseError::NoError || !document.isObject()) {
        return std::nullopt;
    }
    QJsonObject message = document.object();
    if (!message.contains(QLatin1String("type"))) {
        return std::nullopt;
    }
    return message;
}

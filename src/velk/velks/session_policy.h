#pragma once

#include <QJsonObject>
#include <QObject>
#include <QString>

#include <optional>

/// What a policy code requires of the user's session.
struct SessionPolicy
{
    Q_GADGET

public:
    enum class Audience {
        EverySession,
        DomainUsers,
        AddressedDomainUser, ///< the domain user whose uid is in the message
    };
    Q_ENUM(Audience)
    enum class Action {
        Forward, ///< the session policy service carries it out, not the agent
        LeaveDomain,
        WarnThenLogOut,
        Notify,
        RequestPasswordChange,
    };
    Q_ENUM(Action)

    Action action = Action::Forward;
    Audience audience = Audience::EverySession;
    QString text; ///< shown to the user; empty if the action needs no text or has its own
};

/// The policy of a code; codes that are not in the table are forwarded.
SessionPolicy sessionPolicy(int code);

/// The JSON object in a pushed payload; nothing if the payload holds no JSON object with a "type".
std::optional<QJsonObject> parsePolicyMessage(const QString& payload);

#pragma once

#include <QJsonObject>
#include <QObject>
#include <QString>

#include <optional>

/// What a policy code asks of the user's session.
struct SessionPolicy
{
    Q_GADGET

public:
    enum class Audience {
        EverySession,
        DomainUsers,
        AddressedDomainUser, ///< the domain user whose uid stands in the message
    };
    Q_ENUM(Audience)
    enum class Action {
        Forward, ///< not for the agent: the session policy service carries it out
        LeaveDomain,
        WarnThenLogOut,
        Notify,
        RequestPasswordChange,
    };
    Q_ENUM(Action)

    Action action = Action::Forward;
    Audience audience = Audience::EverySession;
    QString text; ///< shown to the user; empty where the action has a text of its own or none
};

/// The policy of a code; every code that the table does not hold is forwarded.
SessionPolicy sessionPolicy(int code);

/// The message object that a pushed payload holds; nothing if it is no JSON object with a "type".
std::optional<QJsonObject> parsePolicyMessage(const QString& payload);

#include "entry_signals.h"

#include <QDBusArgument>
#include <QDBusMessage>
#include <QDBusPendingCallWatcher>
#include <QHash>

#include "entry.h"
#include "remote_interface.h"

std::shared_ptr<EntrySignals> EntrySignals::of(const QDBusConnection& bus, const QString& service)
{
    static QHash<QPair<QString, QString>, std::weak_ptr<EntrySignals>> known;
    auto& place = known[{bus.name(), service}];
    std::shared_ptr<EntrySignals> shared = place.lock();
    if (!shared) {
        shared.reset(new EntrySignals(bus, service));
        place = shared;
    }
    return shared;
}

EntrySignals::EntrySignals(const QDBusConnection& bus, const QString& service)
    : m_bus(bus)
{
    const QString anyPath;
    const QString anyMember;
    const auto interface = QString::fromLatin1(__Entry::staticInterfaceName());
    m_bus.connect(service, anyPath, kPropertiesInterface, QStringLiteral("PropertiesChanged"), {interface},
                  QString(), this, SLOT(onPropertiesChanged(QDBusMessage)));
    m_bus.connect(service, anyPath, interface, anyMember, this, SLOT(onOwnSignal(QDBusMessage)));
}

void EntrySignals::add(const QString& path, __Entry* entry)
{
    m_entries.insert(path, entry);
}

void EntrySignals::remove(const QString& path, __Entry* entry)
{
    m_entries.remove(path, entry);
}

void EntrySignals::catchUp()
{
    if (m_isCatchingUp) {
        m_wasReadMeanwhile = true;
        return;
    }
    m_isCatchingUp = true;
    QMetaObject::invokeMethod(this, &EntrySignals::askBus, Qt::QueuedConnection);
}

bool EntrySignals::isCatchingUp() const
{
    return m_isCatchingUp;
}

/// Whatever has come by now is passed on before the bus's answer. The question is asked from the event loop:
/// until it runs for the first time, Qt holds signals back, but no answers.
void EntrySignals::askBus()
{
    m_wasReadMeanwhile = false;
    const auto question = QDBusMessage::createMethodCall(
        QStringLiteral("org.freedesktop.DBus"), QStringLiteral("/org/freedesktop/DBus"),
        QStringLiteral("org.freedesktop.DBus.Peer"), QStringLiteral("Ping"));
    auto* watcher = new QDBusPendingCallWatcher(m_bus.asyncCall(question), this);
    connect(watcher, &QDBusPendingCallWatcher::finished, this, [this, watcher] {
        watcher->deleteLater();
        m_isCatchingUp = m_wasReadMeanwhile;
        if (m_isCatchingUp) {
            askBus();
        }
    });
}

void EntrySignals::onPropertiesChanged(const QDBusMessage& signal)
{
    const auto changed = qdbus_cast<QVariantMap>(signal.arguments().value(1));
    const QStringList invalidated = signal.arguments().value(2).toStringList();
    forEachEntry(signal.path(), [&](__Entry& entry) { entry.onPropertiesChanged(changed, invalidated); });
}

void EntrySignals::onOwnSignal(const QDBusMessage& signal)
{
    forEachEntry(signal.path(), [&](__Entry& entry) { entry.onOwnSignal(signal); });
}

void EntrySignals::forEachEntry(const QString& path, const std::function<void(__Entry&)>& call)
{
    const QList<__Entry*> entries = m_entries.values(path);
    for (auto* entry : entries) {
        // Whoever is told of a change may let go of any entry.
        if (m_entries.contains(path, entry)) {
            call(*entry);
        }
    }
}

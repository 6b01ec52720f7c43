#include "entry_signals.h"

#include <QDBusMessage>
#include <QHash>
#include <QStringList>

#include "remote_object.h"

std::shared_ptr<EntrySignals> EntrySignals::of(const QDBusConnection& bus, const QString& service,
                                               const QString& interface)
{
    static QHash<QStringList, std::weak_ptr<EntrySignals>> known;
    auto& place = known[{bus.name(), service, interface}];
    std::shared_ptr<EntrySignals> shared = place.lock();
    if (!shared) {
        shared.reset(new EntrySignals(bus, service, interface));
        place = shared;
    }
    return shared;
}

EntrySignals::EntrySignals(QDBusConnection bus, const QString& service, const QString& interface)
{
    const QString anyPath;
    const QString anyMember;
    bus.connect(service, anyPath, desktopproxies::kPropertiesInterface, QStringLiteral("PropertiesChanged"),
                {interface}, QString(), this, SLOT(onPropertiesChanged(QDBusMessage)));
    bus.connect(service, anyPath, interface, anyMember, this, SLOT(onOwnSignal(QDBusMessage)));
}

void EntrySignals::add(const QString& path, EntryListener* listener)
{
    m_listeners.insert(path, listener);
}

void EntrySignals::remove(const QString& path, EntryListener* listener)
{
    m_listeners.remove(path, listener);
}

void EntrySignals::onPropertiesChanged(const QDBusMessage& signal)
{
    forEachListener(signal.path(), [&](EntryListener& listener) { listener.onPropertiesChanged(signal); });
}

void EntrySignals::onOwnSignal(const QDBusMessage& signal)
{
    forEachListener(signal.path(), [&](EntryListener& listener) { listener.onOwnSignal(signal); });
}

void EntrySignals::forEachListener(const QString& path, const std::function<void(EntryListener&)>& call)
{
    const QList<EntryListener*> listeners = m_listeners.values(path);
    for (auto* listener : listeners) {
        // A listener may remove others.
        if (m_listeners.contains(path, listener)) {
            call(*listener);
        }
    }
}

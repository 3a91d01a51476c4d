/// Hears what the OBEX service says of its transfers, and when it goes. Main queue only; this layer's own business.
#pragma once

#include "base/Affinity.h"

#include <QDBusConnection>
#include <QDBusMessage>
#include <QObject>
#include <QVariantMap>

#include <functional>

namespace devices {

class ObexWatch final : public QObject {
    Q_OBJECT

public:
    struct Handlers {
        std::function<void(const QString& path, const QVariantMap& properties)> changed;
        std::function<void(const QString& path)> removed;
        std::function<void()> gone;
    };

    /// `owner` is what the bus calls the service. A handler may end this by letGo() only.
    ObexWatch(QDBusConnection bus, const QString& owner, Handlers handlers);

    /// No handler is called any more; it goes when that can be.
    void letGo();

private Q_SLOTS:
    void propertiesChanged(const QDBusMessage& signal);
    void interfacesRemoved(const QDBusMessage& signal);
    void nameOwnerChanged(const QString& name, const QString& before, const QString& now);
    void busEnded();

private:
    Handlers m_handlers;
    base::Affinity m_affinity;
};

} // namespace devices

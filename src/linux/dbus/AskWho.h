/// Asks the bus who calls; this layer's own business.
#pragma once

#include "linux/dbus/Asker.h"

#include <QDBusConnection>
#include <QObject>
#include <QString>
#include <QVariantMap>

#include <functional>
#include <memory>

namespace dbus {

/// `known` runs on the thread of `context`, once, and never after `context` is destroyed. To be called on that thread.
/// It is told of an asker without a process when the bus does not say, when `name`, a unique one, has left the bus, and
/// when it is somebody else's meanwhile.
void askWho(const QDBusConnection& bus, const QString& name, QObject& context,
            std::function<void(std::shared_ptr<const Asker> asker)> known);

/// What a connection's credentials come to. The process is held, if it is still there.
Asker askerFrom(const QVariantMap& credentials);

} // namespace dbus

/// What a service's object manager lists. Any thread; this layer's own business.
#pragma once

#include <QDBusMessage>
#include <QMap>
#include <QString>
#include <QVariantMap>

namespace devices {

/// Interfaces by name, with their properties.
using Interfaces = QMap<QString, QVariantMap>;

/// By path; nothing when the reply is no such list.
QMap<QString, Interfaces> managedObjects(const QDBusMessage& reply);

} // namespace devices

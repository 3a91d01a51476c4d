#include "linux/devices/ManagedObjects.h"

#include "linux/devices/Calls.h"

#include <QDBusArgument>
#include <QDBusObjectPath>

namespace devices {

QMap<QString, Interfaces> managedObjects(const QDBusMessage& reply)
{
    QMap<QString, Interfaces> objects;
    if (!isReply(reply, "a{oa{sa{sv}}}"))
        return objects;
    const auto list = reply.arguments().constFirst().value<QDBusArgument>();
    list.beginMap();
    while (!list.atEnd()) {
        QDBusObjectPath path;
        Interfaces interfaces;
        list.beginMapEntry();
        list >> path >> interfaces;
        list.endMapEntry();
        objects.insert(path.path(), interfaces);
    }
    list.endMap();
    return objects;
}

} // namespace devices

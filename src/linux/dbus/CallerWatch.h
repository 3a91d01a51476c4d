/// Tells who has left the bus; this layer's own business. Lives on one thread, whose Qt event loop runs.
#pragma once

#include "base/Affinity.h"

#include <QDBusConnection>
#include <QDBusServiceWatcher>
#include <QObject>
#include <QString>

#include <functional>

namespace dbus {

class CallerWatch {
public:
    /// `left` is called with a name that is watched when nobody has it any more, not before watch() returns.
    CallerWatch(const QDBusConnection& bus, std::function<void(const QString& name)> left);

    void watch(const QString& name);
    void forget(const QString& name);

private:
    QDBusServiceWatcher m_watcher;
    std::function<void(const QString& name)> m_left;
    base::Affinity m_affinity;
};

} // namespace dbus

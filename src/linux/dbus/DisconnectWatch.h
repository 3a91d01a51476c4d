/// Tells, once, that a private connection has ended. Lives on the thread that is told; this layer's own business.
#pragma once

#include "base/Affinity.h"

#include <QDBusConnection>
#include <QObject>

#include <functional>

namespace dbus {

class DisconnectWatch final : public QObject {
    Q_OBJECT

public:
    /// `ended` runs on the thread of this object, never before watch() returns to that thread's loop.
    explicit DisconnectWatch(std::function<void()> ended, QObject* parent = nullptr);

    void watch(QDBusConnection connection);
    /// Before the connection is let go of: Qt tells of its end while it is being deleted, and what has been told and not
    /// delivered by then refers to it.
    void forget(QDBusConnection connection);

private Q_SLOTS:
    void tell();

private:
    std::function<void()> m_ended;
    base::Affinity m_affinity;
};

} // namespace dbus

/// A message bus, connected to on a thread of its own when it is first needed: a bus may be slow to let anybody in.
/// Main queue only.
#pragma once

#include "base/Affinity.h"
#include "base/Queue.h"

#include <QDBusConnection>

#include <functional>
#include <memory>

namespace bus {

class Bus {
public:
    /// Called on a thread of its own, where it may block; it owns what it uses, for it may outlive everything.
    using Connect = std::function<QDBusConnection()>;

    /// Those that all of this process share.
    static Connect session();
    static Connect system();

    /// `queue` outlives this.
    Bus(base::MainQueue& queue, Connect connect);
    ~Bus();
    Bus(const Bus&) = delete;
    Bus& operator=(const Bus&) = delete;

    /// `use` runs once: at once when there is a connection, else when there is one or it has failed, which a connection
    /// says itself. Not once this has gone.
    void use(std::function<void(const QDBusConnection& bus)> use);

private:
    struct State;

    std::shared_ptr<State> m_state;
    base::Affinity m_affinity;
};

} // namespace bus

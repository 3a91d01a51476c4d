/// Questions to services on a bus: none waits, and none is waited for longer than its limit by the clock. Main queue only.
#pragma once

#include "base/Affinity.h"
#include "base/Queue.h"

#include <QDBusConnection>
#include <QDBusMessage>

#include <cstdint>
#include <functional>
#include <map>
#include <memory>

namespace bus {

class Calls {
public:
    using Answer = std::function<void(const QDBusMessage& reply)>;

    explicit Calls(base::MainQueue& queue);
    /// No answer comes any more.
    ~Calls();
    Calls(const Calls&) = delete;
    Calls& operator=(const Calls&) = delete;

    /// `answer` runs once, not before this returns, with a reply or an error; an error of TimedOut once `limit` has passed.
    /// `late` gets what comes when nobody listens any more, also after this has gone, to undo what has been done.
    void ask(const QDBusConnection& bus, const QDBusMessage& question, base::Instant limit, Answer answer,
             Answer late = {});
    /// No answer of what has been asked comes any more.
    void forget();

private:
    struct State {
        std::map<std::uint64_t, Answer> answers;
        std::uint64_t last = 0;
    };

    base::MainQueue& m_queue;
    std::shared_ptr<State> m_state = std::make_shared<State>();
    base::Affinity m_affinity;
};

/// For `service`, which may be what a connection is called by the bus; it is not started by being asked.
QDBusMessage question(const QString& service, const QString& path, const char* interface, const char* member,
                      const QVariantList& arguments = {});
/// For the bus itself.
QDBusMessage questionToBus(const char* member, const QVariantList& arguments);

/// Whether it is a reply with what `signature` says.
bool isReply(const QDBusMessage& reply, const char* signature);

} // namespace bus

/// One thing that is asked of the portal, and that takes as long as a dialogue with the user does. Main queue only.
///
/// Its end is listened for before it is asked, at the path that the portal's interface promises. It ends once: with an
/// answer, when the portal does not take the call or vanishes, or when it is let go; then its dialogue is closed, also when
/// the portal opens it only later.
#pragma once

#include "linux/portals/Portal.h"
#include "linux/portals/RequestSignals.h"

#include <QDBusMessage>
#include <QVariantMap>

#include <chrono>
#include <functional>
#include <memory>
#include <string>

namespace portals {

class PortalRequest {
public:
    enum class End {
        Done,      ///< with the results
        Cancelled, ///< by the user
        Refused,   ///< the portal cannot do it, or what it says means nothing
        NoAnswer,  ///< there is no portal, or it does not take the call
        Vanished   ///< in the middle
    };
    struct Outcome {
        End end;
        QVariantMap results;
        std::string reason; ///< for the log
    };
    struct Call {
        const char* interface;
        const char* member;
        QVariantList arguments; ///< between the parent window and the options
        QVariantMap options;
    };
    using Ended = std::function<void(const Outcome& outcome)>;

    /// For the portal to take the call; the dialogue that follows may take for ever. On the clock.
    static constexpr std::chrono::seconds kCallLimit{20};

    /// `ended` runs once, not before this returns, and not once this has gone. It may let go of this.
    PortalRequest(std::shared_ptr<Portal> portal, Call call, Ended ended);
    ~PortalRequest();
    PortalRequest(const PortalRequest&) = delete;
    PortalRequest& operator=(const PortalRequest&) = delete;

private:
    void findPortal(const QDBusConnection& bus);
    void ask(const QDBusConnection& bus, const QString& owner);
    void answered(const QDBusMessage& reply);
    void listen(const QString& path);
    void respond(const QDBusMessage& response);
    void end(End how, std::string reason, QVariantMap results = {});

    const std::shared_ptr<Portal> m_portal;
    Call m_call;
    Ended m_ended;
    bool m_isOver = false;
    bool m_isAsked = false;
    QDBusConnection m_bus{QString()};
    QString m_owner;
    QString m_path;
    RequestSignals m_signals;
    bus::Calls m_calls;
    std::shared_ptr<int> m_alive = std::make_shared<int>(); ///< for tasks
    base::Affinity m_affinity;
};

} // namespace portals

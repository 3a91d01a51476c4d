/// Clipsa on the session bus, as org.clipsa.Clipsa: recorders hand in movies, each gets an editor and a session of its
/// own, and is told how it ended.
///
/// Lives on one thread, whose Qt event loop runs. It does not start editors itself: it is given how to.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/dbus/EditRequest.h"
#include "linux/dbus/EditorReport.h"

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace dbus {

class RecorderService {
public:
    /// An editor that was started for somebody. Destroying it ends it the hard way.
    class Editor {
    public:
        virtual ~Editor() = default;
        /// Asks it to go: its `ended` follows, or an error as `started`.
        virtual void close() = 0;
    };

    /// On the service's thread; none before the launcher has returned.
    struct EditorEvents {
        /// The first, and the only one when there is an error: no editor could be started. One of kBadInputDomain is
        /// told to the caller as its own.
        std::function<void(const base::Result<void>& started)> started;
        /// What became of a movie; some of it also after `completed`.
        std::function<void(const MovieNote& note)> noted;
        std::function<void(const std::vector<std::string>& activityTypes)> completed;
        /// The last; `failure` says why the user did not get to finish, and is empty after `completed`.
        std::function<void(const std::string& failure)> ended;
    };

    /// Begins to start an editor. Must not wait for the caller's files, which can be as slow as they like.
    using Launcher = std::function<std::unique_ptr<Editor>(EditRequest request, EditorEvents events)>;

    /// The most sessions that a caller can have at a time; a call for another is refused.
    static constexpr int kMaximumSessions = 8;

    /// `whenIdle` is called when there has been nothing to do for `idle`, and the name has been given back.
    static base::Result<std::unique_ptr<RecorderService>> start(Launcher launcher, std::chrono::milliseconds idle,
                                                                std::function<void()> whenIdle);
    ~RecorderService();

    /// Asks all editors to go; `whenIdle` follows as soon as they have. Nobody else is served.
    void close();

private:
    class Bus;

    explicit RecorderService(std::unique_ptr<Bus> bus);

    std::unique_ptr<Bus> m_bus;
    base::Affinity m_affinity;
};

} // namespace dbus

/// One editor, from being asked for to being gone: its directory, its process, the connection, and the movie on its way.
///
/// Lives on one thread, whose Qt event loop runs; handlers are called there, `ended` last and once, and it may destroy
/// the session. What the recorder handed in is neither changed nor removed, whatever happens.
#pragma once

#include "app/host/EditorProcess.h"
#include "base/Affinity.h"
#include "base/Result.h"
#include "linux/dbus/EditRequest.h"
#include "linux/dbus/EditorReport.h"

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace host {

struct EditorOutcome {
    /// What the user did, in order; nothing when the editor did not say that the user has finished.
    std::optional<std::vector<std::string>> activityTypes;
    /// How the editor's process ended.
    ProcessEnd end;
    /// Why there was nothing to edit, if so: the movie could not be handed over, or is none (of dbus::kBadInputDomain;
    /// the editor has said so on standard error).
    base::ErrorRef error;
    /// Whether the editor went because close() asked it to.
    bool closed = false;

    /// For who did not ask for it: "the editor ended early, by signal 9 (Killed)".
    std::string words() const;
    /// Why the user did not get to finish, whoever is to blame; empty when they did.
    std::string failure() const;
};

class EditorSession {
public:
    struct Place {
        std::string editorProgram;
        std::string directoriesRoot; ///< directories of dead editors in it are swept meanwhile
        /// How long an editor that has nothing to finish may take to go after being asked, and after SIGTERM, before
        /// stronger means are used.
        std::chrono::milliseconds leavingLimit = std::chrono::seconds(10);
        /// How long a session that is over waits for its files, which a slow disk can hold up, before it leaves that
        /// work to itself.
        std::chrono::milliseconds filesLimit = std::chrono::seconds(2);
    };
    struct Handlers {
        /// What became of a movie, in order. All of it is told before `ended`, and what is known by then before
        /// `finished`.
        std::function<void(const dbus::MovieNote&)> noted = {};
        /// The user has finished; the editor is being closed.
        std::function<void(const std::vector<std::string>& activityTypes)> finished;
        /// A copy has been under way for a second; at most once.
        std::function<void(std::uint64_t totalBytes)> copying;
        std::function<void(const EditorOutcome&)> ended;
    };

    /// Starts the editor before anything that takes long; the movie arrives while it starts up.
    static base::Result<std::unique_ptr<EditorSession>> start(dbus::EditRequest request, const Place& place,
                                                              Handlers handlers);
    /// Closes the editor the hard way if it still runs.
    ~EditorSession();

    /// Asks the editor to go; `ended` follows when it has.
    void close();

private:
    struct State;

    explicit EditorSession(std::unique_ptr<State> state);

    std::unique_ptr<State> m_state;
    base::Affinity m_affinity;
};

} // namespace host

/// The media engine for a command without a window: queues, workers, and Ctrl+C. One at a time, on the main thread, and
/// made before any other thread: it keeps SIGINT, SIGTERM and SIGHUP from ending the process at once.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"
#include "base/System.h"
#include "base/WorkList.h"
#include "platform/media/MediaFramework.h"

#include <functional>
#include <memory>
#include <string>

namespace host {

class MediaTool {
public:
    MediaTool();
    ~MediaTool();
    MediaTool(const MediaTool&) = delete;
    MediaTool& operator=(const MediaTool&) = delete;

    const base::System& system() const;
    platform::MediaFramework& media();
    /// Prints, on standard error, what of that kind has been logged since this was called last: what the engine says
    /// while it works is only kept, because most of a failure is told by the command's own one line.
    void tellLog(base::MemoryLog::Line::Kind kind);

    /// Opens a movie and waits for it. The error names the file and says what is wrong with it; ECANCELED when a signal
    /// came first.
    base::Result<std::shared_ptr<platform::Asset>> open(const std::string& path);

    /// Runs the main queue until `done` holds. False when a signal came first, now or in an earlier call: what is under
    /// way must be given up then. `meanwhile`, if there is one, is called about ten times a second.
    bool runUntil(const std::function<bool()>& done, const std::function<void()>& meanwhile = {});
    /// What keeps a command from ending, for whoever works for it beside the engine.
    base::WorkList& works();
    /// Runs the main queue until nothing is under way any more. A signal calls `giveUp`, which should make that soon.
    void finishWork(const std::function<void()>& giveUp, const std::function<void()>& meanwhile);
    /// Starts `session` and runs the main queue until it has ended and its file is whole or gone. A signal cancels it,
    /// and is told as ECANCELED. Null when the movie is there.
    base::ErrorRef runExport(platform::ExportSession& session, const std::function<void()>& meanwhile);
    /// The signal that came; 0 when none did.
    int interruption() const;

    /// Prints why a command failed, as its one line on standard error, and gives its exit status: 2 for input that
    /// cannot be opened, 128 and the signal (without a line) when one came, else 1.
    int fail(const base::ErrorRef& error) const;

private:
    struct Machine;

    base::Affinity m_affinity;
    std::unique_ptr<Machine> m_machine;
};

} // namespace host

#include "app/host/MediaTool.h"

#include "app/host/ExitStatus.h"
#include "app/host/InputFile.h"
#include "app/host/Streams.h"
#include "app/host/TerminationSignals.h"
#include "linux/dbus/EditRequest.h"
#include "linux/ffmpeg/FFmpegMediaFramework.h"
#include "linux/posix/Event.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdint>
#include <filesystem>
#include <initializer_list>
#include <optional>
#include <poll.h>
#include <vector>

namespace host {

namespace {

constexpr base::Instant kMeanwhile = std::chrono::milliseconds(100);

/// For poll(), rounded up: who is woken too early would spin.
int milliseconds(base::Instant time)
{
    const auto rounded = std::chrono::ceil<std::chrono::milliseconds>(time).count();
    return static_cast<int>(std::clamp<std::int64_t>(rounded, 0, 60'000));
}

} // namespace

struct MediaTool::Machine {
    TerminationWatch signals;
    posix::Event woken;

    base::SystemClock clock;
    base::MemoryLog log;
    std::size_t told = 0; ///< lines of it
    base::MainQueue mainQueue{clock, [this] { woken.happen(); }};
    base::WorkerQueue background;
    base::WorkerQueue standard;
    base::System system{log, clock, mainQueue, background, standard};
    base::WorkList works;
    runtime::NotificationCenter center;
    ffmpeg::FFmpegMediaFramework media{system, center, {{}, {}, &works}};

    Machine()
    {
        works.setChangeHandler([this] { woken.happen(); });
    }

    /// Until one of `descriptors` can be read from, one of which is `woken`.
    void wait(std::initializer_list<int> descriptors, std::optional<base::Instant> limit) const
    {
        std::vector<pollfd> inputs;
        for (const int descriptor : descriptors)
            inputs.push_back({descriptor, POLLIN, {}});
        ::poll(inputs.data(), inputs.size(), limit ? milliseconds(*limit) : -1);
        woken.forget();
    }
};

MediaTool::MediaTool() : m_machine(std::make_unique<Machine>()) {}

MediaTool::~MediaTool()
{
    m_affinity.assertHere();
}

const base::System& MediaTool::system() const
{
    m_affinity.assertHere();
    return m_machine->system;
}

platform::MediaFramework& MediaTool::media()
{
    m_affinity.assertHere();
    return m_machine->media;
}

void MediaTool::tellLog(base::MemoryLog::Line::Kind kind)
{
    m_affinity.assertHere();
    const auto lines = m_machine->log.lines();
    for (std::size_t& i = m_machine->told; i < lines.size(); ++i)
        if (lines[i].kind == kind)
            complain(lines[i].text);
}

base::Result<std::shared_ptr<platform::Asset>> MediaTool::open(const std::string& path)
{
    m_affinity.assertHere();
    // Looked at first, because the words for what is no file are better there.
    if (const auto file = openInput(path, Emptiness::Refused); !file)
        return file.error();
    std::error_code error;
    const std::string whole = std::filesystem::absolute(path, error).native();
    const auto asset = m_machine->media.assetWithURL(base::Url::fromPath(error ? path : whole));
    bool loaded = false;
    asset->whenLoaded([&loaded] { loaded = true; });
    if (!runUntil([&] { return loaded; }))
        return base::Error::fromErrno(ECANCELED, "cannot open " + path);
    if (asset->error()) // the engine's words, but the user's file
        return base::Error::make(dbus::kBadInputDomain, asset->error()->code(), asset->error()->description());
    return asset;
}

bool MediaTool::runUntil(const std::function<bool()>& done, const std::function<void()>& meanwhile)
{
    m_affinity.assertHere();
    Machine& machine = *m_machine;
    base::Instant next = machine.clock.now();
    while (machine.signals.arrived() == 0) {
        machine.mainQueue.runDue();
        if (done())
            return true;
        std::optional<base::Instant> limit = machine.mainQueue.untilNext();
        if (meanwhile) {
            if (const base::Instant now = machine.clock.now(); now >= next) {
                meanwhile();
                next = now + kMeanwhile;
            }
            const base::Instant left = next - machine.clock.now();
            limit = limit ? std::min(*limit, left) : left;
        }
        machine.wait({machine.woken.descriptor(), machine.signals.descriptor()}, limit);
    }
    return false;
}

base::ErrorRef MediaTool::runExport(platform::ExportSession& session, const std::function<void()>& meanwhile)
{
    m_affinity.assertHere();
    session.exportAsynchronously([] {});
    finishWork([&session] { session.cancelExport(); }, meanwhile);
    switch (session.status()) {
    case platform::ExportSession::Status::Completed:
        return nullptr;
    case platform::ExportSession::Status::Failed:
        return session.error();
    default:
        return base::Error::fromErrno(ECANCELED, "cannot export the movie");
    }
}

base::WorkList& MediaTool::works()
{
    m_affinity.assertHere();
    return m_machine->works;
}

void MediaTool::finishWork(const std::function<void()>& giveUp, const std::function<void()>& meanwhile)
{
    m_affinity.assertHere();
    Machine& machine = *m_machine;
    if (!runUntil([&machine] { return machine.works.isEmpty(); }, meanwhile))
        giveUp();
    // Whatever signals come: who was interrupted only finishes what is under way, and is woken by that alone.
    while (!machine.works.isEmpty()) {
        machine.wait({machine.woken.descriptor()}, machine.mainQueue.untilNext());
        machine.mainQueue.runDue();
    }
    machine.mainQueue.drain();
}

int MediaTool::interruption() const
{
    m_affinity.assertHere();
    return m_machine->signals.arrived();
}

int MediaTool::fail(const base::ErrorRef& error) const
{
    m_affinity.assertHere();
    if (interruption() != 0)
        return 128 + interruption();
    complain(error->description());
    return error->domain() == dbus::kBadInputDomain ? kExitUsage : kExitFailed;
}

} // namespace host

#include "linux/sharing/OutboxActivity.h"

#include <cerrno>
#include <optional>

namespace sharing {

namespace {

/// Between two of these nobody sees a difference.
constexpr double kWorthTelling = 0.01;

} // namespace

OutboxActivity::~OutboxActivity()
{
    assertHere();
    if (m_wanted)
        *m_wanted = false;
}

bool OutboxActivity::canPerformWithActivityItems(const platform::ShareItems& items) const
{
    assertHere();
    return !platform::filesOf(items).empty();
}

void OutboxActivity::prepareWithActivityItems(const platform::ShareItems& items)
{
    assertHere();
    m_text = platform::textOf(items);
    m_originals.clear();
    for (const base::Url& file : platform::filesOf(items)) {
        m_originals.push_back({m_environment.files.resolvedPath(file.path()), m_environment.nameOf(file)});
        if (takesOnlyTheMovie())
            break;
    }
}

std::string OutboxActivity::title() const
{
    const std::string name = m_originals.empty() ? std::string() : m_originals.front().name;
    const std::size_t dot = name.rfind('.');
    return dot == 0 ? name : name.substr(0, dot);
}

void OutboxActivity::performActivity()
{
    assertHere();
    m_work = m_environment.works.begin();
    m_wanted = std::make_shared<std::atomic<bool>>(true);
    noteProgress(std::nullopt);
    const auto kept = std::make_shared<Files>();
    const auto put = [originals = m_originals, outbox = m_environment.outbox, use = m_use, tells = tellsPutting(),
                      kept](const std::function<bool(double)>& goOn) -> base::Result<void> {
        for (const auto& [path, name] : originals) {
            if (!goOn(0))
                return base::Error::fromErrno(ECANCELED, "putting it into the outbox");
            const auto tell = [&](std::uint64_t copied, std::uint64_t total) {
                const double part = total > 0 ? static_cast<double>(copied) / static_cast<double>(total) : 0;
                const double progress =
                    (static_cast<double>(kept->size()) + part) / static_cast<double>(originals.size());
                return goOn(tells ? progress : 0);
            };
            auto file = outbox.put(path, name, tell, use);
            if (!file)
                return file.error();
            kept->push_back(std::move(file).value());
        }
        return {};
    };
    const auto nothing = [](const auto&) { return base::Result<void>(); };
    workInBackground(needsOutbox() ? Work(put) : Work(nothing), [this, kept] {
        m_files = std::move(*kept);
        give();
    });
}

void OutboxActivity::workInBackground(Work work, std::function<void()> done)
{
    base::MainQueue& main = m_environment.system.mainQueue;
    const auto weak = weakSelf<OutboxActivity>();
    const auto goOn = [weak, &main, wanted = m_wanted, told = 0.0](double progress) mutable {
        if (progress >= told + kWorthTelling) {
            told = progress;
            main.post([weak, turn = Turn(wanted), progress] {
                if (const auto self = weak.lock(); self && self->isUnderWay(turn))
                    self->setProgress(progress);
            });
        }
        return wanted->load();
    };
    m_environment.system.defaultQueue.post(
        [weak, &main, turn = turn(), goOn, work = std::move(work), done = std::move(done)]() mutable {
            main.post([weak, turn, result = work(goOn), done = std::move(done)] {
                // Locked here: a strong reference on the worker could be the last one and end us on the wrong thread.
                const auto self = weak.lock();
                if (!self || !self->isUnderWay(turn))
                    return;
                if (result)
                    done();
                else
                    self->fail(result.error());
            });
        });
}

void OutboxActivity::setProgress(double progress) const
{
    if (!isUnderWay())
        return;
    m_work->setProgress(progress);
    noteProgress(progress);
}

void OutboxActivity::cancel()
{
    assertHere();
    if (!isUnderWay())
        return;
    *m_wanted = false;
    giveUp();
}

void OutboxActivity::end(bool completed, base::ErrorRef error)
{
    assertHere();
    if (!isUnderWay())
        return;
    stop();
    // Kept until those who wait for us have been told: the process may end with it.
    const auto work = std::move(m_work);
    if (error)
        m_environment.system.log.error("cannot share by " + activityType() + ": " + error->description());
    if (completed || !error)
        activityDidFinish(completed);
    else
        activityDidFail(std::move(error));
}

} // namespace sharing

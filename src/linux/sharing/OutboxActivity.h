/// An activity that gives files to somebody else: they are put into the outbox first, on a worker, under the names that
/// their receiver is to see, and stay there for whoever reads them when we have gone. Main queue only.
///
/// It keeps the process alive until its end; whoever lets go of it before gives it up.
#pragma once

#include "linux/sharing/Environment.h"
#include "platform/sharing/Activity.h"

#include <atomic>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace sharing {

class OutboxActivity : public platform::Activity {
public:
    OutboxActivity(const Environment& environment, Outbox::Use use) : m_environment(environment), m_use(use) {}
    ~OutboxActivity() override;

    /// There has to be a file.
    bool canPerformWithActivityItems(const platform::ShareItems& items) const override;
    void prepareWithActivityItems(const platform::ShareItems& items) override;
    void performActivity() override;
    void cancel() override;

protected:
    using Files = std::vector<std::shared_ptr<const Outbox::File>>;

    const Environment& environment() const { return m_environment; }
    /// As they lie in the outbox, in order; from give() on.
    const Files& files() const { return m_files; }
    const std::string& text() const { return m_text; }
    /// The first file's, as its receiver sees it, without what kind of file it is.
    std::string title() const;

    /// Only the first file goes; the others stay.
    virtual bool takesOnlyTheMovie() const { return false; }
    /// Else they are given as they are.
    virtual bool needsOutbox() const { return true; }
    /// The files are ready. Ends, at some time, with complete(), giveUp() or fail().
    virtual void give() = 0;
    /// Lets go of what give() began and is not over; called before each end.
    virtual void stop() = 0;
    /// Whether putting the files there is worth being told: not where what follows takes so much longer.
    virtual bool tellsPutting() const { return true; }

    struct Original {
        std::string path;
        std::string name; ///< what its receiver is to see
    };
    /// The files as they were before they were put into the outbox; the first is the movie.
    const std::vector<Original>& originals() const { return m_originals; }

    /// `work` runs on a worker. It tells how far it is, from 0 to 1, and stops when that gives false. When it has failed this
    /// ends with its error; else `done` runs here, unless it was ended meanwhile.
    using Work = std::function<base::Result<void>(const std::function<bool(double progress)>& goOn)>;
    void workInBackground(Work work, std::function<void()> done);

    bool isUnderWay() const { return m_work != nullptr; }
    /// One performance of it: what belongs to an earlier one comes to nothing.
    using Turn = std::weak_ptr<const std::atomic<bool>>;
    Turn turn() const { return m_wanted; }
    bool isUnderWay(const Turn& turn) const { return isUnderWay() && turn.lock() == m_wanted; }
    void setProgress(double progress) const;
    void complete() { end(true, nullptr); }
    /// The user wanted it so.
    void giveUp() { end(false, nullptr); }
    /// `error` carries a message for people.
    void fail(base::ErrorRef error) { end(false, std::move(error)); }

private:
    void end(bool completed, base::ErrorRef error);

    const Environment& m_environment;
    const Outbox::Use m_use;
    std::string m_text;
    std::vector<Original> m_originals;
    Files m_files;
    std::shared_ptr<base::Work> m_work;
    std::shared_ptr<std::atomic<bool>> m_wanted; ///< by the worker's task
};

} // namespace sharing

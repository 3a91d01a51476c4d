/// The store as AppStream knows it: what installed applications say of themselves, and the catalogues of distributions
/// and of Flatpak remotes. Any thread.
///
/// Nothing is loaded, and no library, before prepare() or the first look-up. Look-ups are answered on a worker, one after
/// the other; catalogues are read on another, because that may take seconds where nobody has done so before. What is
/// wrong with files is said on the log; an answer comes all the same.
#pragma once

#include "base/Log.h"
#include "base/Queue.h"
#include "linux/storefront/Source.h"
#include "platform/storefront/StoreLookup.h"

#include <atomic>
#include <functional>
#include <memory>

namespace storefront {

/// The domain of its errors.
inline constexpr const char* kStoreErrorDomain = "store";
/// There is nothing on this machine that could read catalogues.
inline constexpr std::int64_t kStoreUnavailable = 1;
/// Something was asked for that is not known here.
inline constexpr std::int64_t kStoreBadRequest = 2;

class AppStreamStore final : public platform::StoreLookup {
public:
    /// Who makes the sources; null for one that cannot be made.
    struct Makers {
        std::function<std::unique_ptr<Source>()> installed;
        std::function<std::unique_ptr<Source>()> published;
    };

    /// The log outlives it. Sources come from the library that the options name, unless there are other makers.
    AppStreamStore(base::Log& log, Options options, Makers makers = {});
    /// Ends, and waits for what is being read just now.
    ~AppStreamStore() override;

    /// Begins to read what look-ups need, so that the first is quick. Returns at once.
    void prepare();

    /// Gives one result for each of the identifiers that is known, in their order. An identifier may have ".desktop" at
    /// its end or not, whichever way the catalogues have it. While the catalogues are still being read, an answer waits
    /// for them no longer than the options' patience, and is then what installed applications say. `callback` runs on the
    /// worker.
    void start(platform::StoreLookupRequest request, Callback callback) override;

    /// Callbacks that have not begun never come, and nothing more is read. Returns at once.
    void end() { m_ends = true; }

private:
    struct Published;

    void answer(const platform::StoreLookupRequest& request, const Callback& callback);
    std::vector<platform::StoreItem> resultsFor(const platform::StoreLookupRequest& request);
    std::shared_ptr<Published> askCatalogues(const platform::StoreLookupRequest& request);
    bool makeSources();
    Makers makersOfLibrary() const;

    base::Log& m_log;
    const Options m_options;
    std::atomic<bool> m_ends = false;
    // These are the answering worker's.
    Makers m_makers;
    bool m_asked = false;
    std::unique_ptr<Source> m_installed;
    // The reading worker's.
    std::unique_ptr<Source> m_published;
    // Last: they use all of the above, and the second the first, until they have ended.
    base::WorkerQueue m_reading;
    base::WorkerQueue m_answering;
};

} // namespace storefront

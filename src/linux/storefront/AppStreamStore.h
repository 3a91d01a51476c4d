/// The store as AppStream knows it: what installed applications say of themselves, and the catalogues of distributions
/// and of Flatpak remotes. Any thread.
///
/// Nothing is loaded, and no library, before prepare() or the first look-up. All work is done on a worker of its own, one
/// look-up after the other. What is wrong with files is said on the log; an answer comes all the same.
#pragma once

#include "linux/storefront/Catalogue.h"
#include "platform/storefront/StoreLookup.h"

#include "base/Log.h"
#include "base/Queue.h"

#include <atomic>
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
    /// The log outlives it.
    AppStreamStore(base::Log& log, Options options);
    /// Ends, and waits for what is being read just now.
    ~AppStreamStore() override;

    /// Begins to read what look-ups need, so that the first is quick. Returns at once.
    void prepare();

    /// Gives one result for each of the identifiers that is known, in their order. An identifier may have ".desktop" at
    /// its end or not, whichever way the catalogues have it. `callback` runs on the worker.
    void start(platform::StoreLookupRequest request, Callback callback) override;

    /// Callbacks that have not begun never come, and nothing more is read. Returns at once.
    void end() { m_ends = true; }

private:
    void answer(const platform::StoreLookupRequest& request, const Callback& callback);
    Catalogue* catalogue();

    base::Log& m_log;
    const Options m_options;
    std::atomic<bool> m_ends = false;
    // These are the worker's.
    bool m_asked = false;
    std::unique_ptr<Catalogue> m_catalogue;
    base::WorkerQueue m_worker; ///< last: it uses all of the above until it has ended
};

} // namespace storefront

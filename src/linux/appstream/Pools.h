/// The catalogues, read for a language at a time and kept. One thread.
///
/// The library keeps them on disk in a form of its own, shared with other programs: where that is fresh, reading takes a
/// millisecond, else about a second.
#pragma once

#include "base/Affinity.h"
#include "base/Log.h"
#include "linux/appstream/Component.h"
#include "linux/appstream/GObjects.h"
#include "linux/storefront/Options.h"

#include <appstream.h>
#include <map>
#include <optional>
#include <string>

namespace appstream {

class Pools {
public:
    /// More text than that would take more memory to read than a phone has: nothing is read, and the log says so.
    static constexpr std::uintmax_t kLargest = std::uintmax_t(128) << 20;

    /// Options and log outlive it.
    Pools(const storefront::Options& options, base::Log& log);

    /// Reads for a language, once.
    void load(const std::string& locale);
    /// The best that is known under an identifier, with ".desktop" or without. Of several origins: an application before
    /// anything else, what is called so before what only provides it, one with a public page, the higher priority in its
    /// catalogue, and then the name of the origin, so that it is the same each time.
    std::optional<Component> find(const std::string& identifier, const std::string& locale);
    /// Says on the log, once something was not found, when there are files and nothing in what was read.
    void review();

private:
    AsPool* pool(const std::string& locale);
    Owned<AsPool> read(const std::string& locale) const;

    const storefront::Options& m_options;
    base::Log& m_log;
    std::map<std::string, Owned<AsPool>> m_pools; ///< by locale; null when there is too much
    bool m_hasMissed = false;
    bool m_reviewed = false;
    base::Affinity m_affinity;
};

} // namespace appstream

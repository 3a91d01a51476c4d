/// The two who know applications by AppStream: the applications themselves, and the catalogues. One thread each.
#pragma once

#include "base/Affinity.h"
#include "linux/appstream/GObjects.h"
#include "linux/appstream/Metainfo.h"
#include "linux/appstream/Pools.h"
#include "linux/storefront/Source.h"

namespace appstream {

class InstalledSource final : public storefront::Source {
public:
    /// Options and log outlive it.
    InstalledSource(const storefront::Options& options, base::Log& log);

    void load() override;
    std::optional<storefront::Facts> find(const std::string& identifier, bool inUsersLanguages) override;
    /// Says nothing more: what cannot be read was said when it was read.
    void review() override;

private:
    const storefront::Options& m_options;
    Metainfo m_metainfo;
    base::Affinity m_affinity;
};

class PublishedSource final : public storefront::Source {
public:
    /// Options and log outlive it.
    PublishedSource(const storefront::Options& options, base::Log& log);
    ~PublishedSource() override;

    void load() override;
    std::optional<storefront::Facts> find(const std::string& identifier, bool inUsersLanguages) override;
    void review() override;

private:
    const storefront::Options& m_options;
    Owned<GMainContext> m_context; ///< the thread's own: nothing of the library's reaches the main loop
    Pools m_pools;
    base::Affinity m_affinity;
};

} // namespace appstream

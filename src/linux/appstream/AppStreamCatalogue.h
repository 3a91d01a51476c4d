/// The store's knowledge from AppStream: what an installed application says of itself goes first, the catalogues say the
/// rest. One thread.
#pragma once

#include "base/Affinity.h"
#include "linux/appstream/GObjects.h"
#include "linux/appstream/Genres.h"
#include "linux/appstream/Metainfo.h"
#include "linux/appstream/Pools.h"
#include "linux/storefront/Catalogue.h"

#include <optional>
#include <string>

namespace appstream {

class AppStreamCatalogue final : public storefront::Catalogue {
public:
    /// Options and log outlive it.
    AppStreamCatalogue(const storefront::Options& options, base::Log& log);
    ~AppStreamCatalogue() override;

    void load() override;
    /// The link is the public page of the best catalogue that has one, else the application's homepage.
    std::optional<platform::StoreItem> find(const std::string& identifier, bool inUsersLanguages) override;
    void review() override;

private:
    const storefront::Options& m_options;
    Owned<GMainContext> m_context; ///< the thread's own: nothing of the library's reaches the main loop
    Metainfo m_metainfo;
    Pools m_pools;
    base::Affinity m_affinity;
};

} // namespace appstream

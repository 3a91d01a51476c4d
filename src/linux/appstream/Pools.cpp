#include "linux/appstream/Pools.h"

#include "linux/appstream/CatalogueFiles.h"
#include "linux/appstream/PublicPage.h"

#include <malloc.h>
#include <tuple>
#include <vector>

// Exported, but in no public header; so it may be missing in another version.
extern "C" [[gnu::weak]] void as_pool_override_cache_locations(AsPool* pool, const gchar* system, const gchar* user);

namespace appstream {

namespace {

/// The lower the better, from the first difference on.
auto rank(const Component& component, const std::string& identifier, const storefront::Options& options)
{
    return std::tuple(!component.isApplication(), withoutDesktop(component.identifier()) != withoutDesktop(identifier),
                      !publicPage(component, options.remotes), -component.priority(), component.origin());
}

} // namespace

Pools::Pools(const storefront::Options& options, base::Log& log) : m_options(options), m_log(log) {}

void Pools::load(const std::string& locale)
{
    m_affinity.assertHere();
    pool(locale);
}

AsPool* Pools::pool(const std::string& locale)
{
    const auto known = m_pools.find(locale);
    return (known != m_pools.end() ? known : m_pools.emplace(locale, read(locale)).first)->second.get();
}

Owned<AsPool> Pools::read(const std::string& locale) const
{
    const CatalogueFiles files = catalogueFiles(m_options);
    if (files.size > kLargest) {
        m_log.error("The store's catalogues are too large to be read (about " + std::to_string(files.size >> 20)
                    + " MB, the first is " + files.first.native() + ")");
        return nullptr;
    }
    Owned<AsPool> pool(as_pool_new());
    // In this order: the first overwrites flags, and what is loaded depends on all of them.
    as_pool_set_load_std_data_locations(pool.get(), FALSE);
    if (m_options.usesMachineCatalogues)
        as_pool_set_flags(pool.get(), AsPoolFlags(AS_POOL_FLAG_LOAD_OS_CATALOG | AS_POOL_FLAG_LOAD_FLATPAK));
    as_pool_set_locale(pool.get(), locale.c_str());
    for (const auto& directory : m_options.catalogues)
        as_pool_add_extra_data_location(pool.get(), directory.c_str(), AS_FORMAT_STYLE_CATALOG);
    if (!m_options.cache.empty() && as_pool_override_cache_locations)
        as_pool_override_cache_locations(pool.get(), m_options.cache.c_str(), m_options.cache.c_str());
    // When its cache cannot be written, AppStream 0.16 gives an error that it has freed already, and frees it twice where
    // none is wanted: so it is taken, and neither read nor freed.
    GError* unread = nullptr;
    if (as_pool_load(pool.get(), nullptr, &unread) == FALSE)
        m_log.error("Not all of the store's catalogues could be loaded; perhaps AppStream's cache cannot be written");
    // Reading takes twenty times the memory that is needed from then on.
    ::malloc_trim(0);
    return pool;
}

std::optional<Component> Pools::find(const std::string& identifier, const std::string& locale)
{
    m_affinity.assertHere();
    AsPool* const known = pool(locale);
    std::optional<Component> best;
    if (!known)
        return best;
    const std::string plain = withoutDesktop(identifier);
    for (const std::string& form : {plain, plain + ".desktop"}) {
        const Owned<GPtrArray> found(as_pool_get_components_by_id(known, form.c_str()));
        for (AsComponent* each : Elements<AsComponent>(found.get()))
            if (const Component component(each);
                !best || rank(component, identifier, m_options) < rank(*best, identifier, m_options))
                best = component;
    }
    m_hasMissed = m_hasMissed || !best;
    return best;
}

void Pools::review()
{
    m_affinity.assertHere();
    if (m_reviewed || !m_hasMissed)
        return;
    for (const auto& [locale, pool] : m_pools) {
        if (!pool)
            continue;
        m_reviewed = true;
        const CatalogueFiles files = catalogueFiles(m_options);
        // The library takes what it cannot parse for empty.
        if (files.count > 0 && Owned<GPtrArray>(as_pool_get_components(pool.get()))->len == 0)
            m_log.error("The store's catalogues have nothing in them that can be read; the first is "
                        + files.first.native());
        return;
    }
}

} // namespace appstream

#include "linux/appstream/Sources.h"

#include "linux/appstream/Facts.h"

namespace appstream {

InstalledSource::InstalledSource(const storefront::Options& options, base::Log& log)
    : m_options(options), m_metainfo(log, options.metainfo)
{
}

void InstalledSource::load()
{
    m_affinity.assertHere();
}

std::optional<storefront::Facts> InstalledSource::find(const std::string& identifier, bool inUsersLanguages)
{
    m_affinity.assertHere();
    return factsOf([&](const std::string& locale) { return m_metainfo.find(identifier, locale); }, m_options,
                   inUsersLanguages);
}

void InstalledSource::review()
{
    m_affinity.assertHere();
}

PublishedSource::PublishedSource(const storefront::Options& options, base::Log& log)
    : m_options(options), m_context(g_main_context_new()), m_pools(options, log)
{
    g_main_context_push_thread_default(m_context.get());
}

PublishedSource::~PublishedSource()
{
    m_affinity.assertHere();
    g_main_context_pop_thread_default(m_context.get());
}

void PublishedSource::load()
{
    m_affinity.assertHere();
    m_pools.load(m_options.locales.front());
}

std::optional<storefront::Facts> PublishedSource::find(const std::string& identifier, bool inUsersLanguages)
{
    m_affinity.assertHere();
    return factsOf([&](const std::string& locale) { return m_pools.find(identifier, locale); }, m_options,
                   inUsersLanguages);
}

void PublishedSource::review()
{
    m_affinity.assertHere();
    m_pools.review();
}

} // namespace appstream

extern "C" [[gnu::visibility("default")]] storefront::Source*
clipsaMakeInstalledSource(const storefront::Options& options, base::Log& log)
{
    return new appstream::InstalledSource(options, log);
}

extern "C" [[gnu::visibility("default")]] storefront::Source*
clipsaMakePublishedSource(const storefront::Options& options, base::Log& log)
{
    return new appstream::PublishedSource(options, log);
}

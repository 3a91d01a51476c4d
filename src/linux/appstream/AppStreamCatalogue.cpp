#include "linux/appstream/AppStreamCatalogue.h"

#include "linux/appstream/PublicPage.h"

#include <string>

namespace appstream {

namespace {

/// One source of what is known of one application, in any language.
using Source = std::function<std::optional<Component>(const std::string& locale)>;

/// The text in the first of the languages to which it was translated, else as it was written. A source gives the latter
/// also where there is no translation, and does not say which it gave: they are compared.
Component::Text translated(const Source& source, Component::Text (Component::*text)() const,
                           const std::vector<std::string>& locales)
{
    const auto in = [&](const std::string& locale) {
        const auto component = source(locale);
        return component ? ((*component).*text)() : std::nullopt;
    };
    for (const std::string& locale : locales) {
        Component::Text known = in(locale);
        if (&locale == &locales.back() || storefront::isEnglish(locale) || known != in("C"))
            return known;
    }
    return std::nullopt;
}

} // namespace

AppStreamCatalogue::AppStreamCatalogue(const storefront::Options& options, base::Log& log)
    : m_options(options), m_context(g_main_context_new()), m_metainfo(log, options.metainfo), m_pools(options, log)
{
    g_main_context_push_thread_default(m_context.get());
}

AppStreamCatalogue::~AppStreamCatalogue()
{
    m_affinity.assertHere();
    g_main_context_pop_thread_default(m_context.get());
}

void AppStreamCatalogue::load()
{
    m_affinity.assertHere();
    m_pools.load(m_options.locales.front());
}

std::optional<platform::StoreItem> AppStreamCatalogue::find(const std::string& identifier, bool inUsersLanguages)
{
    m_affinity.assertHere();
    const std::vector<std::string> locales = inUsersLanguages ? m_options.locales : std::vector<std::string>{"C"};
    const Genres genres(inUsersLanguages);
    const Source installed = [&](const std::string& locale) { return m_metainfo.find(identifier, locale); };
    const Source published = [&](const std::string& locale) { return m_pools.find(identifier, locale); };

    platform::StoreItem item;
    Component::Text page, homepage;
    bool isKnown = false;
    for (const Source& source : {installed, published}) {
        const auto component = source(locales.front());
        if (!component)
            continue;
        isKnown = true;
        if (!item.displayName)
            item.displayName = translated(source, &Component::name, locales);
        if (!item.artistName)
            item.artistName = translated(source, &Component::developer, locales);
        if (!item.genreNames)
            item.genreNames = genres.namesOf(component->categories());
        if (!page)
            page = publicPage(*component);
        if (!homepage)
            homepage = component->homepage();
    }
    if (!isKnown)
        return std::nullopt;
    item.shortProductLink = page ? page : homepage;
    return item;
}

void AppStreamCatalogue::review()
{
    m_affinity.assertHere();
    m_pools.review();
}

} // namespace appstream

extern "C" [[gnu::visibility("default")]] storefront::Catalogue* clipsaMakeCatalogue(const storefront::Options& options,
                                                                                     base::Log& log)
{
    return new appstream::AppStreamCatalogue(options, log);
}

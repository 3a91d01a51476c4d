#include "linux/appstream/AppStreamCatalogue.h"

#include "linux/appstream/PublicPage.h"

#include <functional>
#include <map>
#include <string>
#include <utility>

namespace appstream {

namespace {

/// What one source knows of one application, asked once for each language.
class Source {
public:
    using Find = std::function<std::optional<Component>(const std::string& locale)>;
    explicit Source(Find find) : m_find(std::move(find)) {}

    const std::optional<Component>& in(const std::string& locale)
    {
        const auto known = m_known.find(locale);
        return (known != m_known.end() ? known : m_known.emplace(locale, m_find(locale)).first)->second;
    }

private:
    Find m_find;
    std::map<std::string, std::optional<Component>> m_known;
};

/// The text in the first of the languages to which it was translated, else as it was written. A source gives the latter
/// also where there is no translation, and does not say which it gave: they are compared.
Component::Text translated(Source& source, Component::Text (Component::*text)() const,
                           const std::vector<std::string>& locales)
{
    const auto in = [&](const std::string& locale) {
        const auto& component = source.in(locale);
        return component ? ((*component).*text)() : std::nullopt;
    };
    for (const std::string& locale : locales) {
        Component::Text known = in(locale);
        if (&locale == &locales.back() || known != in("C"))
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
    Source installed([&](const std::string& locale) { return m_metainfo.find(identifier, locale); });
    Source published([&](const std::string& locale) { return m_pools.find(identifier, locale); });

    platform::StoreItem item;
    Component::Text page, homepage;
    bool isKnown = false;
    for (Source* const source : {&installed, &published}) {
        const auto& component = source->in(locales.front());
        if (!component)
            continue;
        isKnown = true;
        if (!item.displayName)
            item.displayName = translated(*source, &Component::name, locales);
        if (!item.artistName)
            item.artistName = translated(*source, &Component::developer, locales);
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

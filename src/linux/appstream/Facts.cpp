#include "linux/appstream/Facts.h"

#include "linux/appstream/Genres.h"
#include "linux/appstream/PublicPage.h"

#include <map>

namespace appstream {

namespace {

class Translations {
public:
    Translations(const FindComponent& find, const std::vector<std::string>& locales) : m_find(find), m_locales(locales)
    {
    }

    const std::optional<Component>& in(const std::string& locale)
    {
        const auto known = m_known.find(locale);
        return (known != m_known.end() ? known : m_known.emplace(locale, m_find(locale)).first)->second;
    }

    /// Where there is no translation a source gives the text as it was written, and does not say so: they are compared.
    Component::Text text(Component::Text (Component::*field)() const)
    {
        const auto translation = [&](const std::string& locale) {
            const auto& component = in(locale);
            return component ? ((*component).*field)() : std::nullopt;
        };
        for (const std::string& locale : m_locales) {
            Component::Text known = translation(locale);
            if (&locale == &m_locales.back() || known != translation("C"))
                return known;
        }
        return std::nullopt;
    }

private:
    const FindComponent& m_find;
    const std::vector<std::string>& m_locales;
    std::map<std::string, std::optional<Component>> m_known;
};

} // namespace

std::optional<storefront::Facts> factsOf(const FindComponent& find, const storefront::Options& options,
                                         bool inUsersLanguages)
{
    const std::vector<std::string> asWritten = {"C"};
    const std::vector<std::string>& wanted = inUsersLanguages ? options.locales : asWritten;
    Translations translations(find, wanted);
    const auto& component = translations.in(wanted.front());
    if (!component)
        return std::nullopt;
    storefront::Facts facts;
    facts.name = translations.text(&Component::name);
    facts.developer = translations.text(&Component::developer);
    facts.page = publicPage(*component, options.remotes);
    facts.homepage = component->homepage();
    facts.genres = Genres(inUsersLanguages).namesOf(component->categories());
    return facts;
}

} // namespace appstream

#include "linux/appstream/Component.h"

#include "base/Text.h"

#include <algorithm>

namespace appstream {

namespace {

constexpr std::string_view kDesktop = ".desktop";
constexpr std::size_t kLongestName = 256;     // bytes
constexpr std::size_t kLongestAddress = 2048; // bytes; what all browsers take

Component::Text nameOf(const char* text)
{
    if (!text)
        return std::nullopt;
    std::string name = text;
    if (name.empty() || name.size() > kLongestName || base::printable(name) != name)
        return std::nullopt;
    return name;
}

std::string orEmpty(const char* text)
{
    return text ? text : "";
}

} // namespace

bool isWebAddress(std::string_view text)
{
    const std::size_t scheme = text.find("://");
    if (scheme == std::string_view::npos || text.size() > kLongestAddress)
        return false;
    std::string name(text.substr(0, scheme));
    std::transform(name.begin(), name.end(), name.begin(), base::lowercase);
    const std::string_view rest = text.substr(scheme + 3);
    return (name == "http" || name == "https") && !rest.empty() && rest.front() != '/'
           && std::all_of(rest.begin(), rest.end(), [](char character) { return character > ' ' && character < 0x7F; });
}

std::string withoutDesktop(std::string_view identifier)
{
    if (identifier.ends_with(kDesktop))
        identifier.remove_suffix(kDesktop.size());
    return std::string(identifier);
}

Component::Component(AsComponent* component)
    : m_component(static_cast<AsComponent*>(g_object_ref(component)),
                  [](AsComponent* object) { g_object_unref(object); })
{
}

Component::Text Component::name() const
{
    return nameOf(as_component_get_name(m_component.get()));
}

Component::Text Component::developer() const
{
    return nameOf(as_component_get_developer_name(m_component.get()));
}

Component::Text Component::homepage() const
{
    const char* const address = as_component_get_url(m_component.get(), AS_URL_KIND_HOMEPAGE);
    return address && isWebAddress(address) ? Text(address) : std::nullopt;
}

std::string Component::origin() const
{
    return orEmpty(as_component_get_origin(m_component.get()));
}

std::string Component::identifier() const
{
    return orEmpty(as_component_get_id(m_component.get()));
}

int Component::priority() const
{
    return as_component_get_priority(m_component.get());
}

bool Component::isApplication() const
{
    const AsComponentKind kind = as_component_get_kind(m_component.get());
    return kind == AS_COMPONENT_KIND_DESKTOP_APP || kind == AS_COMPONENT_KIND_CONSOLE_APP
           || kind == AS_COMPONENT_KIND_WEB_APP;
}

std::string Component::flatpakReference() const
{
    AsBundle* const bundle = as_component_get_bundle(m_component.get(), AS_BUNDLE_KIND_FLATPAK);
    return bundle ? orEmpty(as_bundle_get_id(bundle)) : std::string();
}

bool Component::hasCustomKey(std::string_view prefix) const
{
    GHashTableIter iterator;
    gpointer key = nullptr;
    g_hash_table_iter_init(&iterator, as_component_get_custom(m_component.get()));
    while (g_hash_table_iter_next(&iterator, &key, nullptr))
        if (std::string_view(static_cast<const char*>(key)).starts_with(prefix))
            return true;
    return false;
}

GPtrArray* Component::categories() const
{
    return as_component_get_categories(m_component.get());
}

} // namespace appstream

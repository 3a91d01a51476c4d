#include "linux/appstream/Genres.h"

#include "linux/appstream/GObjects.h"

#include <algorithm>
#include <appstream.h>

namespace appstream {

Genres::Genres(bool inUsersLanguages)
{
    const Owned<GPtrArray> known(as_get_default_categories(FALSE));
    for (AsCategory* category : Elements<AsCategory>(known.get())) {
        const char* name = as_category_get_name(category);
        // The library itself looks its names up in the table of the program, which is ours.
        if (inUsersLanguages)
            name = g_dgettext("appstream", name);
        for (const char* group : Elements<char>(as_category_get_desktop_groups(category)))
            m_names.emplace(group, name);
    }
}

std::optional<std::vector<std::string>> Genres::namesOf(const GPtrArray* categories) const
{
    std::vector<std::string> names;
    for (const char* category : Elements<char>(categories))
        if (const auto found = m_names.find(category);
            found != m_names.end() && std::find(names.begin(), names.end(), found->second) == names.end())
            names.push_back(found->second);
    return names.empty() ? std::nullopt : std::optional(names);
}

} // namespace appstream

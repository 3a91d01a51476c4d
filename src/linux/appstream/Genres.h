/// What genres are called that applications belong to. Any thread.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

#include <glib.h>

namespace appstream {

/// The main categories, by the names that people read: "Games" of "Game". What is finer ("ArcadeGame") and what nobody
/// reads ("Qt", "X-Vendor") has no name.
class Genres {
public:
    /// As AppStream calls them, in the process's language or in English.
    explicit Genres(bool inUsersLanguages);

    /// In the order of `categories`, each once; nothing when there is none.
    std::optional<std::vector<std::string>> namesOf(const GPtrArray* categories) const;

private:
    std::map<std::string, std::string> m_names; ///< by category
};

} // namespace appstream

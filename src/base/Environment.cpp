#include "base/Environment.h"

#include <cstdlib>
#include <sstream>

namespace base {

std::string environment(const char* name)
{
    const char* value = std::getenv(name); // NOLINT(concurrency-mt-unsafe): nobody changes it
    return value ? value : "";
}

std::vector<std::string> preferredLocales(const Environment& environment)
{
    std::vector<std::string> names;
    std::istringstream languages(environment("LANGUAGE"));
    for (std::string name; std::getline(languages, name, ':');)
        names.push_back(name);
    for (const char* variable : {"LC_ALL", "LC_MESSAGES", "LANG"})
        if (const std::string name = environment(variable); !name.empty()) {
            names.push_back(name);
            break;
        }
    return names;
}

} // namespace base

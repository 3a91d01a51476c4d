/// For programs that get an environment of their own: tools/mutate chooses by variables what is broken in them.
#pragma once

#include <cstdlib>
#include <string>
#include <vector>

namespace tests {

inline std::vector<std::string> withMutation(std::vector<std::string> environment)
{
    for (const char* name : {"CLIPSA_MUTANT", "CLIPSA_MUTANTS_REACHED"})
        if (const char* value = std::getenv(name))
            environment.push_back(std::string(name) + "=" + value);
    return environment;
}

} // namespace tests

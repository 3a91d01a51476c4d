#include "base/Environment.h"

#include <cstdlib>

namespace base {

std::string environment(const char* name)
{
    const char* value = std::getenv(name); // NOLINT(concurrency-mt-unsafe): nobody changes it
    return value ? value : "";
}

} // namespace base

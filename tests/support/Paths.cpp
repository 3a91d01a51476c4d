#include "support/Paths.h"

namespace tests {

// The only file that knows these folders, so that the others compile to the same in each build folder.

std::string movie(const std::string& name)
{
    return std::string(CLIPSA_TEST_MOVIES "/") + name;
}

std::string program(const std::string& name)
{
    return std::string(CLIPSA_BIN "/") + name;
}

std::string sourceFile(const std::string& name)
{
    return std::string(CLIPSA_SOURCE "/") + name;
}

} // namespace tests

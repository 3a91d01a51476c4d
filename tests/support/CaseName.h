/// How a parametrised case is called after a file: GoogleTest takes letters, digits and underscores only.
#pragma once

#include <algorithm>
#include <cctype>
#include <string>

namespace tests {

inline std::string caseName(std::string file)
{
    std::replace_if(
        file.begin(), file.end(), [](unsigned char letter) { return std::isalnum(letter) == 0; }, '_');
    return file;
}

} // namespace tests

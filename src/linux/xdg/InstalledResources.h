/// Where what was installed with our programs lies. Any thread.
#pragma once

#include <string>

namespace xdg {

/// Beside bin/ or libexec/clipsa/ of the program that runs.
std::string resourceDirectory();

/// The bundle with the program's own words.
std::string wordsPath();

} // namespace xdg

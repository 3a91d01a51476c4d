/// The process's environment, which nobody changes once it has started: so any thread may read it.
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace base {

/// The value of a variable; empty where it is not set.
std::string environment(const char* name);

/// The same of another environment.
using Environment = std::function<std::string(const char* name)>;

/// What the user wants to read, most preferred first, as locales are called ("de_AT.UTF-8"): LANGUAGE's, then that of the
/// first of LC_ALL, LC_MESSAGES and LANG that is set. Nothing is left out, and nothing is checked.
std::vector<std::string> preferredLocales(const Environment& environment);

} // namespace base

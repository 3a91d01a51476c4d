/// The process's environment, which nobody changes once it has started: so any thread may read it.
#pragma once

#include <string>

namespace base {

/// The value of a variable; empty where it is not set.
std::string environment(const char* name);

} // namespace base

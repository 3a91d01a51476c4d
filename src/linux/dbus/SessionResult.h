/// What a recorder is told of a result, member by member: the same on the bus and in JSON. Any thread.
#pragma once

#include "linux/dbus/EditorReport.h"

#include <string>
#include <utility>
#include <vector>

namespace dbus {

/// Names and texts; members that are not known are left out. The first is `outcome`.
using SessionResult = std::vector<std::pair<std::string, std::string>>;

/// Empty for what is no result of its own: a movie that is none fails its session.
SessionResult resultOf(const MovieNote& note);
/// Why the user did not get to finish.
SessionResult resultOfFailure(const std::string& reason);

} // namespace dbus

/// What kind of machine this is, as the system's host name service knows it. Any thread; waits for the answer.
#pragma once

#include <chrono>
#include <optional>
#include <string>

namespace dbus {

/// "handset", "tablet", "convertible", "laptop", "desktop", …; nothing when there is no such service, when it does not
/// know, or when it does not answer within the limit.
std::optional<std::string> chassis(std::chrono::milliseconds limit = std::chrono::milliseconds(250));

} // namespace dbus

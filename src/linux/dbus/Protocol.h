/// What host and extension call each other by on their private connection: paths, names and limits. No state.
#pragma once

#include "runtime/Selector.h"

#include <cstddef>
#include <cstdint>
#include <string>

namespace dbus {

inline constexpr const char* kHostPath = "/org/clipsa/Host";
/// Hands out the payload: `InputItems() → a(saas)`, titles and, for each attachment, the types that it conforms to;
/// `LoadItem(u item, u attachment, s type) → v`, text as `s`, colours as `(dddd)`.
inline constexpr const char* kRuntimeInterface = "org.clipsa.ExtensionRuntime1";

/// The longest text that is taken from the other side, in bytes of UTF-8.
inline constexpr std::size_t kMaximumTextSize = 1 << 20;
/// More items than anybody has use for; whoever sends more is broken.
inline constexpr std::size_t kMaximumCount = 1024;

/// The domain of this layer's errors.
inline constexpr const char* kErrorDomain = "org.clipsa.connection";
enum ErrorCode : std::int64_t {
    kNotConnected = 1,
    kUnknownMessage = 2,
    kBadArgument = 3,
    kMalformed = 4,
    kTooLarge = 5,
    kRefused = 6, ///< the other side answered with an error
};

/// "org.clipsa." and the protocol's name.
std::string interfaceName(const std::string& protocol);
/// The selector's words, each with a capital, without colons: "extensionDidFinish:" is "ExtensionDidFinish".
std::string memberName(const runtime::Selector& selector);

} // namespace dbus

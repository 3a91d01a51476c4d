/// The errors that the system itself makes: a code, and words for the user. Any thread.
#pragma once

#include "base/Error.h"

#include <cstdint>

/// The domain of the system's own errors.
inline constexpr const char* VKUserErrorDomain = "clipsa";

/// There is no movie to work on.
inline constexpr std::int64_t VKErrorNoMovie = -5818;
/// A movie could not be exported, or its export was cancelled.
inline constexpr std::int64_t VKErrorExportFailed = -5812;

namespace VKExtensions {

/// An error of the system's domain. Its description says what went wrong and what to do, unless `userInfo` brings words
/// of its own; a code that is not known is named by its number.
base::ErrorRef _vkUserErrorForCode_userInfo(std::int64_t code, base::Error::UserInfo userInfo = {});

} // namespace VKExtensions

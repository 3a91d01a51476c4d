/// The reason why a movie's pictures, or its sound, cannot be copied, as an error: whoever gets it encodes these instead.
#pragma once

#include "base/Error.h"
#include "linux/ffmpeg/Libraries.h"

#include <string>

namespace ffmpeg {

inline constexpr const char* kCannotCopyDomain = "ffmpeg.copying";

inline base::ErrorRef cannotCopy(std::string reason)
{
    return base::Error::make(kCannotCopyDomain, AVERROR_PATCHWELCOME, std::move(reason));
}

inline constexpr const char* kCannotCopySoundDomain = "ffmpeg.copying.sound";

inline base::ErrorRef cannotCopySound(std::string reason)
{
    return base::Error::make(kCannotCopySoundDomain, AVERROR_PATCHWELCOME, std::move(reason));
}

inline bool saysCannotCopySound(const base::ErrorRef& error)
{
    return error && error->domain() == kCannotCopySoundDomain;
}

inline bool saysCannotCopy(const base::ErrorRef& error)
{
    return error && error->domain() == kCannotCopyDomain;
}

} // namespace ffmpeg

/// The reason why a track's packets cannot be copied, as an error: whoever gets it encodes instead.
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

inline bool saysCannotCopy(const base::ErrorRef& error)
{
    return error && error->domain() == kCannotCopyDomain;
}

} // namespace ffmpeg

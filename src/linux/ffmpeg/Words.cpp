#include "linux/ffmpeg/Words.h"

#include "base/Error.h"
#include "linux/ffmpeg/Libraries.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>

namespace ffmpeg {

std::string textOf(int avError)
{
    switch (avError) {
    case AVERROR_INVALIDDATA:
        return "it is damaged, or of a kind that is not known here";
    case AVERROR_EOF:
        return "it ends too early";
    case AVERROR_EXIT:
        return "it is no longer wanted";
    case AVERROR_DECODER_NOT_FOUND:
        return "there is no decoder for it here";
    case AVERROR_ENCODER_NOT_FOUND:
        return "there is no encoder for it here; install one with the libraries of FFmpeg";
    case AVERROR_PATCHWELCOME:
    case AVERROR(ENOSYS):
        return "this variety of it is not known here";
    case AVERROR_STREAM_NOT_FOUND:
        return "a track is missing";
    case AVERROR(EINVAL):
        return "it contradicts itself";
    case AVERROR(ERANGE):
        return "it has numbers that are out of all bounds";
    default:
        break;
    }
    // The libraries' own codes are far below those of the system.
    constexpr int kMostErrno = 4095;
    if (avError < 0 && avError >= -kMostErrno)
        return base::Error::meaningOf(AVUNERROR(avError));
    return "something unexpected happened (" + std::to_string(avError) + ")";
}

const char* messageKeyOf(int avError)
{
    switch (avError) {
    case AVERROR_INVALIDDATA:
        return "MOVIE_DAMAGED";
    case AVERROR_EOF:
        return "MOVIE_TOO_SHORT";
    case AVERROR_DECODER_NOT_FOUND:
    case AVERROR_PATCHWELCOME:
    case AVERROR(ENOSYS):
        return "MOVIE_WITHOUT_DECODER";
    case AVERROR(ENOENT):
        return "MOVIE_GONE";
    case AVERROR(EACCES):
    case AVERROR(EPERM):
        return "MOVIE_NOT_ALLOWED";
    case AVERROR(EIO):
        return "MOVIE_UNREADABLE";
    default:
        return "MOVIE_UNKNOWN";
    }
}

base::ErrorRef notAMovie(const std::string& name, const base::ErrorRef& why)
{
    const auto known = why->userInfo().find(base::Error::kMessageKey);
    return base::Error::withMessage(
        base::Error::make(why->domain(), why->code(),
                          "“" + name + "” is not a movie that can be opened: " + why->description() + "."),
        known != why->userInfo().end() ? known->second : messageKeyOf(static_cast<int>(why->code())), {{"name", name}});
}

std::string lengthInWords(double seconds)
{
    char text[32];
    const auto whole = std::max(60LL, static_cast<long long>(seconds));
    if (seconds < 0.1)
        std::snprintf(text, sizeof text, "%.2f s", seconds);
    else if (seconds < 59.95) // which is not "60.0 s"
        std::snprintf(text, sizeof text, "%.1f s", seconds);
    else if (whole < 3600)
        std::snprintf(text, sizeof text, "%lld:%02lld", whole / 60, whole % 60);
    else
        std::snprintf(text, sizeof text, "%lld:%02lld:%02lld", whole / 3600, whole / 60 % 60, whole % 60);
    return text;
}

} // namespace ffmpeg

/// What the movies in the temporary directory are called: a stem, the time in whole seconds, ".mp4". Any thread.
///
/// Two movies of the same stem in the same second get the same name; nothing guards against it.
#pragma once

#include "base/Date.h"
#include "base/Url.h"

#include <string>
#include <string_view>

namespace support {

/// The output of mixing the audio tracks.
inline constexpr std::string_view kMixedMovieName = "VKClipsa_Final";
/// The copy that is handed to the video service.
inline constexpr std::string_view kUploadMovieName = "VKClipsa_YouTube";

/// The output of trimming a recording of that app: its name as far as a file's name can have it.
std::string trimmedMovieName(std::string_view appName);

/// `tempPath`, a slash whatever it ends with, `name`: the two slashes in a row are how these paths are known.
std::string tempMovieStem(std::string_view tempPath, std::string_view name);

/// The movie of that stem that is made at `now`.
base::Url tempMovieUrl(std::string_view stem, base::Date now);

} // namespace support

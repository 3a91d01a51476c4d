/// What the words of the commands say that need no window, only the media engine. Any thread.
#pragma once

#include "base/Geometry.h"
#include "base/MediaTime.h"
#include "base/Result.h"

#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace host {

struct ThumbnailsCommand {
    std::string movie;
    int count = 0;      ///< at least 1
    std::string output; ///< the directory for the pictures
    base::Size size;    ///< pixels that they are fitted into; zero: as large as they are
    bool force = false; ///< replaces files that are there
};

struct ProbeCommand {
    std::string movie;
    bool json = false;
};

struct TrimCommand {
    std::string movie;
    base::MediaTime from = base::MediaTime::zero();
    std::optional<base::MediaTime> to; ///< behind `from`; the movie's end when it is not given
    std::string output;
    bool force = false; ///< replaces a file that is there
};

struct MixCommand {
    std::string movie;
    std::string output;
    bool force = false; ///< replaces a file that is there
};

struct SaveCommand {
    std::string movie;
    std::string appName; ///< empty: the movie's file name without its extension
};

struct ShareCommand {
    std::string movie;
    bool list = false; ///< only says what it could be shared with
    /// An activity type, or the type and whom to share with: "Bluetooth:Pixel 7".
    std::string with;
    std::string message; ///< text that goes along
};

using MediaCommand = std::variant<TrimCommand, MixCommand, ThumbnailsCommand, ProbeCommand, SaveCommand, ShareCommand>;

/// "12.5", "1:30" or "01:02:03.25", exact to the microsecond. Nothing when it is no time.
std::optional<base::MediaTime> momentIn(const std::string& text);

/// Whether `name` is one of these commands.
bool isMediaCommand(const std::string& name);

/// `words` with the command's name in front, which is one of these. Nothing when they ask for help.
base::Result<std::optional<MediaCommand>> parseMediaCommand(const std::vector<std::string>& words);

} // namespace host

/// What a recording is called in the library. Any thread.
#pragma once

#include "base/Date.h"

#include <string>
#include <string_view>

namespace photos {

/// A file's name in two parts, between which a number fits.
struct LibraryName {
    std::string stem;      ///< "Tux Racer 2026-11-21 15-04-05"
    std::string extension; ///< ".mp4"

    /// The first name is number 1 and carries none; the others are "stem (2).mp4" and so on.
    std::string numbered(int number) const;
};

/// After the app and the date, in local time, which replaces a date that the app's name ends with, as that of a
/// recorder's file does; with the extension of `path`, or that of MPEG-4 when it has none.
LibraryName libraryName(std::string_view appName, base::Date date, std::string_view path);

/// `text` without what some file system, shell or file manager takes amiss; never empty, and short enough to get more
/// words behind it.
std::string fileNameSafe(std::string_view text);

} // namespace photos

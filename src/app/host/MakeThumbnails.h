/// `clipsa thumbnails`: leaves pictures of a movie, evenly spaced, in a directory.
#pragma once

#include "app/host/MediaCommandLine.h"
#include "base/MediaTime.h"

#include <string>
#include <vector>

namespace host {

/// Gives the exit status. Prints a progress bar on a terminal, and one line when something fails; a picture that cannot
/// be made does not keep the others from being made. Files appear whole or not at all, also when a signal comes.
int makeThumbnails(const ThumbnailsCommand& command);

/// The moments of `count` pictures: they begin the parts when the whole is cut into so many equal ones.
std::vector<base::MediaTime> evenlySpaced(base::MediaTime duration, int count);

/// "07_00-01-30.500.png" is the eighth of up to a hundred, at a minute and a half.
std::string thumbnailName(int index, int count, base::MediaTime time);

} // namespace host

/// `clipsa probe`: says what a movie is made of.
#pragma once

#include "app/host/MediaCommandLine.h"
#include "linux/ffmpeg/MovieFacts.h"

#include <string>

namespace host {

/// Gives the exit status. Prints to standard output; when it fails, one line to standard error.
int probeMovie(const ProbeCommand& command);

/// Lines for a person. `file` is what the first of them calls it.
std::string wordsAbout(const std::string& file, const ffmpeg::MovieFacts& facts);
/// One object in one line. Times are seconds, rates are per second, sizes are bytes; what is unknown is left out.
std::string jsonAbout(const std::string& file, const ffmpeg::MovieFacts& facts);

} // namespace host

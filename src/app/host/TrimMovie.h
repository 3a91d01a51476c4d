/// `clipsa trim`: makes a movie of a part of another.
#pragma once

#include "app/host/MediaCommandLine.h"

namespace host {

/// Gives the exit status. The new movie is there whole or not at all; the old one is never touched. Lines on standard
/// error say what went wrong, and what had to be encoded.
int trimMovie(const TrimCommand& command);

} // namespace host

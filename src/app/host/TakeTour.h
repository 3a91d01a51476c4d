/// `clipsa tour`: opens a movie in the editor without a screen, has a script show what there is to see, and leaves a
/// picture of each step. The script is the editor's own resource, scripts/tour.script.
#pragma once

#include "app/host/CommandLine.h"

namespace host {

/// Gives the exit status: 0 only if every step was made, every picture written, and the host told that the user has
/// finished. Prints a summary. Needs what openMovie() needs.
int takeTour(const TourCommand& command);

} // namespace host

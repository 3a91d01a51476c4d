/// `clipsa mix`: makes a movie of another whose sound tracks are one.
#pragma once

#include "app/host/MediaCommandLine.h"

namespace host {

/// Like `clipsa trim` in all but what is exported.
int mixMovie(const MixCommand& command);

} // namespace host

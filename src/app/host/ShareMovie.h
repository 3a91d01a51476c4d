/// `clipsa share`: what the editor's share sheet offers, without the editor.
#pragma once

#include "app/host/MediaCommandLine.h"

namespace host {

/// Gives the exit status: 0 when the receiver took the movie, 3 when the user cancelled it in another program's dialogue.
/// With `list` it prints a line for each activity: what `with` can be, a tab, and what the user knows it by. The movie
/// itself is never touched. A signal cancels what is under way.
int shareMovie(const ShareCommand& command);

} // namespace host

/// What commands that make a movie of another have in common: files that are there already, progress, Ctrl+C, exit status.
#pragma once

#include "app/host/MediaTool.h"

#include <functional>
#include <string>

namespace host {

struct ExportOrder {
    std::string doing; ///< what the progress bar says: "Trimming"
    std::string movie;
    std::string output;
    bool force; ///< replaces a file that is there
    /// What is exported; called once the movie is open.
    std::function<void(platform::ExportSession& session, const platform::Asset& asset)> setUp;
};

/// Gives the exit status. The new movie is there whole or not at all; the old one is never touched. Lines on standard
/// error say what went wrong, and what had to be encoded.
int exportMovie(const ExportOrder& order);

} // namespace host

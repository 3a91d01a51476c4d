/// `clipsa open`: from the words on the command line to the exit status. Runs a Qt event loop until the editor has gone.
#pragma once

#include "app/host/CommandLine.h"
#include "app/host/ExitStatus.h"

#include <cstdint>
#include <functional>
#include <string>
#include <utility>
#include <vector>

namespace host {

/// Results go to standard output, all else to standard error. Needs a QCoreApplication, and the only thread. SIGINT,
/// SIGTERM and SIGHUP close the editor; before there is one they end the process at once.
int openMovie(const OpenCommand& command);

/// What is said of a copy that takes long.
std::string wordsOfCopy(const std::string& movie, std::uint64_t bytes);

/// What a tour has differently.
struct OpenVariation {
    std::vector<std::pair<std::string, std::string>> environment;                ///< added to the editor's
    std::function<void(const std::vector<std::string>& activityTypes)> finished; ///< in place of printing
};
int openMovie(const OpenCommand& command, OpenVariation variation);

} // namespace host

/// `clipsa open`: from the words on the command line to the exit status. Runs a Qt event loop until the editor has gone.
#pragma once

#include "app/host/CommandLine.h"

namespace host {

enum ExitStatus { kExitDone = 0, kExitFailed = 1, kExitUsage = 2, kExitEditorEnded = 3 };

/// Results go to standard output, all else to standard error. Needs a QCoreApplication, and a thread on which SIGINT,
/// SIGTERM and SIGHUP have been blocked before any other was started; they close the editor.
int openMovie(const OpenCommand& command);

} // namespace host

/// `clipsa open`: from the words on the command line to the exit status. Runs a Qt event loop until the editor has gone.
#pragma once

#include "app/host/CommandLine.h"
#include "base/Result.h"
#include "linux/dbus/EditRequest.h"

#include <string>

namespace host {

enum ExitStatus { kExitDone = 0, kExitFailed = 1, kExitUsage = 2, kExitEditorEnded = 3 };

struct OpenRequest {
    dbus::EditRequest request;
    std::string movie; ///< the user's file, links resolved
};

/// Opens and checks the files of a command, and fills in what it leaves open. Touches nothing.
base::Result<OpenRequest> openRequest(const OpenCommand& command);

/// Results go to standard output, all else to standard error. Needs a QCoreApplication, and a thread on which SIGINT,
/// SIGTERM and SIGHUP have been blocked before any other was started; they close the editor.
int openMovie(const OpenCommand& command);

} // namespace host

/// What `clipsa` ends with, as docs/command-line.md tells it. A command that a signal ends adds 128 to its number.
#pragma once

namespace host {

enum ExitStatus {
    kExitDone = 0,
    kExitFailed = 1,      ///< it could not be done
    kExitUsage = 2,       ///< a wrong option or file
    kExitEditorEnded = 3, ///< before the user had finished
};

} // namespace host

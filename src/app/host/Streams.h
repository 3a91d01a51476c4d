/// What the commands write: complaints to standard error, results to standard output. Main thread.
#pragma once

#include <string_view>

namespace host {

/// Makes sure that the standard streams are open, so that no other file can take their place. First of all.
void keepStandardStreams();

/// One line on standard error, "clipsa: …". Nothing in it reaches a terminal as a command.
void complain(std::string_view text);

/// Last of all: `status`, or that of a failure when something could not be written to standard output.
int finishOutput(int status);

} // namespace host

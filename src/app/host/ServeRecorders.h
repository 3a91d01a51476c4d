/// `clipsa service`: serves recorders on the session bus until there has been nothing to do for a while.
#pragma once

#include "app/host/CommandLine.h"

namespace host {

/// Gives the exit status. Needs what openMovie() needs; SIGINT, SIGTERM and SIGHUP close all editors and end it.
int serveRecorders(const ServiceCommand& command);

} // namespace host

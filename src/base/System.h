/// What every layer may need of the machine: log, clock and queues. Made once by the app, which outlives all users.
#pragma once

#include "base/Clock.h"
#include "base/Log.h"
#include "base/Queue.h"

namespace base {

struct System {
    Log& log;
    const Clock& clock;
    MainQueue& mainQueue;
    Queue& backgroundQueue; ///< background priority: removals
    Queue& defaultQueue;    ///< default priority: moves, look-ups
};

} // namespace base

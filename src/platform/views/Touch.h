/// One finger, or the mouse with its button down, from when it comes down until it lifts.
#pragma once

#include "base/Clock.h"
#include "base/Geometry.h"

namespace platform {

struct Touch {
    int id = 0;
    base::Point position; ///< in the window's coordinates
    base::Instant time{0};
};

} // namespace platform

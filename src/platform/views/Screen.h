/// The screen that the system draws for: on a desktop, the window it was given. Main queue only.
#pragma once

#include "base/Geometry.h"

namespace platform {

class Screen {
public:
    virtual ~Screen() = default;
    /// In points.
    virtual base::Rect bounds() const = 0;
    /// Pixels per point.
    virtual double scale() const = 0;
};

} // namespace platform

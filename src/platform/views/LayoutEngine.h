/// Places subviews by equations. Main queue only.
#pragma once

#include "platform/views/LayoutConstraint.h"

#include <vector>

namespace platform {

/// Sets the frames of those subviews of `owner` that do not translate their autoresizing mask, so that `constraints`
/// (oldest first) hold. Where constraints contradict each other the newer one holds; what no constraint determines stays
/// as it is, sizes before positions. Other views, and `owner` itself, are constants.
void solveConstraints(View& owner, const std::vector<LayoutConstraint>& constraints);

/// The value that was meant where arithmetic left a trace: on a grid much finer than any pixel.
double withoutNoise(double value);

} // namespace platform

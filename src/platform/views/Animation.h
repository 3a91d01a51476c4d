/// Animations of view values. The model takes its new value at once; the presenter shows the way there.
#pragma once

#include "base/Clock.h"
#include "base/Geometry.h"
#include "base/Queue.h"

#include <functional>

namespace platform {

enum class AnimatedProperty { Alpha, Frame };

/// One value of one view on its way from what was shown to what the model says now.
struct PropertyAnimation {
    AnimatedProperty property = AnimatedProperty::Alpha;
    double fromAlpha = 0;
    base::Rect fromFrame;
    base::Instant duration{0};
};

/// Runs `changes` at once, noting the values that it changes as animated over `duration`. `completion` runs on the main
/// queue when that time has passed on its clock, with whether the animation ran to its end. Main queue only.
void animate(base::MainQueue& mainQueue, base::Instant duration, const std::function<void()>& changes,
             std::function<void(bool finished)> completion = {});

/// Runs `changes` as if no `animate()` were running: for what is placed before it is first shown.
void withoutAnimation(const std::function<void()>& changes);

/// The duration of the innermost `animate()` that is running its changes; zero outside.
base::Instant currentAnimationDuration();

} // namespace platform

/// What a view is to assistive technology.
#pragma once

#include <string>

namespace platform {

enum class AccessibilityRole { None, Button, Label, Image, Toolbar, Slider, Group, Video, Progress, Dialog };

struct Accessibility {
    AccessibilityRole role = AccessibilityRole::None;
    std::string name;
    std::string value; ///< for labels and sliders, as a person reads it
    bool enabled = true;
    double minimum = 0; ///< for sliders and progress
    double maximum = 0; ///< the same; progress that is not known has none
    double number = 0;
    double step = 0; ///< what one increment moves
};

} // namespace platform

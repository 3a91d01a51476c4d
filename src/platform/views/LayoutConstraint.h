/// An equation between two edges or sizes of views:  first.attribute = second.attribute × multiplier + constant.
#pragma once

#include <memory>

namespace platform {

class View;

enum class LayoutAttribute { None, Leading, Trailing, Top, Bottom, Width, Height, CenterX, CenterY };

struct LayoutConstraint {
    std::weak_ptr<View> first;
    LayoutAttribute firstAttribute = LayoutAttribute::None;
    std::weak_ptr<View> second; ///< empty: the constant alone
    LayoutAttribute secondAttribute = LayoutAttribute::None;
    double multiplier = 1;
    double constant = 0;

    bool refersTo(const View& view) const;
    /// Whether a view that it speaks of is gone.
    bool isDead() const;
    friend bool operator==(const LayoutConstraint& a, const LayoutConstraint& b);
};

} // namespace platform

#include "platform/views/LayoutConstraint.h"

#include "platform/views/View.h"

namespace platform {

namespace {

/// Also tells two views apart that are gone both.
bool isSame(const std::weak_ptr<View>& a, const std::weak_ptr<View>& b)
{
    return !a.owner_before(b) && !b.owner_before(a);
}

} // namespace

bool LayoutConstraint::refersTo(const View& view) const
{
    return first.lock().get() == &view || second.lock().get() == &view;
}

bool LayoutConstraint::isDead() const
{
    return first.expired() || (second.expired() && !isSame(second, {}));
}

bool operator==(const LayoutConstraint& a, const LayoutConstraint& b)
{
    return isSame(a.first, b.first) && a.firstAttribute == b.firstAttribute && isSame(a.second, b.second)
           && a.secondAttribute == b.secondAttribute && a.multiplier == b.multiplier && a.constant == b.constant;
}

} // namespace platform

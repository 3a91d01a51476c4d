#include "platform/views/Animation.h"

#include <utility>

namespace platform {

namespace {

base::Instant s_duration{0}; // main queue only

class DurationScope {
public:
    explicit DurationScope(base::Instant duration) : m_outer(std::exchange(s_duration, duration)) {}
    ~DurationScope() { s_duration = m_outer; }
    DurationScope(const DurationScope&) = delete;
    DurationScope& operator=(const DurationScope&) = delete;

private:
    base::Instant m_outer;
};

} // namespace

void animate(base::MainQueue& mainQueue, base::Instant duration, const std::function<void()>& changes,
             std::function<void(bool finished)> completion)
{
    {
        const DurationScope scope(duration);
        changes();
    }
    if (completion)
        mainQueue.postAfter(duration, [completion = std::move(completion)] { completion(true); });
}

void withoutAnimation(const std::function<void()>& changes)
{
    const DurationScope scope(base::Instant(0));
    changes();
}

base::Instant currentAnimationDuration()
{
    return s_duration;
}

} // namespace platform

#include "base/Clock.h"

namespace base {

Instant SystemClock::now() const
{
    return std::chrono::duration_cast<Instant>(std::chrono::steady_clock::now().time_since_epoch());
}

Date SystemClock::date() const
{
    return {std::chrono::duration<double>(std::chrono::system_clock::now().time_since_epoch()).count()};
}

} // namespace base

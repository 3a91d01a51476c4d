/// The machine's clocks, but for a calendar that a script can put ahead. Any thread.
#pragma once

#include "base/Clock.h"

#include <atomic>

namespace app {

class ScriptClock final : public base::Clock {
public:
    base::Instant now() const override { return m_machine.now(); }
    base::Date date() const override { return {m_machine.date().secondsSince1970 + m_ahead}; }

    void putAhead(double seconds) { m_ahead = m_ahead + seconds; }

private:
    base::SystemClock m_machine;
    std::atomic<double> m_ahead = 0;
};

} // namespace app

/// One value on its way from what was shown to what the model says. A value itself.
#pragma once

#include "base/Clock.h"
#include "base/Geometry.h"

#include <algorithm>

namespace qtui {

/// Slow, fast, slow: from 0 to 1 over `progress` from 0 to 1.
inline double easeInOut(double progress)
{
    const double t = std::clamp(progress, 0.0, 1.0);
    return t * t * (3 - 2 * t);
}

inline double between(double from, double to, double part)
{
    return from + (to - from) * part;
}

inline base::Rect between(const base::Rect& from, const base::Rect& to, double part)
{
    return base::Rect::make(between(from.minX(), to.minX(), part), between(from.minY(), to.minY(), part),
                            between(from.width(), to.width(), part), between(from.height(), to.height(), part));
}

/// So near to its end nobody sees a difference, but the renderer does: it draws an item of almost full opacity a grey level
/// too dark, and takes the full opacity that follows for the same one and draws nothing anew.
inline constexpr double kArrived = 0.999;

template <typename V> class Tween {
public:
    /// Goes from `from` to `to`. Where it is on its way to `from` already, it turns round where it is.
    void start(const V& from, const V& to, base::Instant now, base::Instant duration)
    {
        m_from = m_running && m_to == from ? shown(from, now) : from;
        m_to = to;
        m_start = now;
        m_duration = duration;
        m_running = duration > base::Instant(0);
    }

    /// What to show while the model says `model`. A model that was changed without an animation is followed at once.
    V shown(const V& model, base::Instant now)
    {
        if (m_running && (model != m_to || now >= m_start + m_duration))
            m_running = false;
        if (!m_running)
            return model;
        using Part = std::chrono::duration<double>;
        const double part = easeInOut(Part(now - m_start) / Part(m_duration));
        return part < kArrived ? between(m_from, m_to, part) : m_to;
    }

    bool isRunning() const { return m_running; }

private:
    V m_from{};
    V m_to{};
    base::Instant m_start{0};
    base::Instant m_duration{0};
    bool m_running = false;
};

} // namespace qtui

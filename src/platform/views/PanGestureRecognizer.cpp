#include "platform/views/PanGestureRecognizer.h"

#include "platform/views/Window.h"

#include <chrono>
#include <cmath>
#include <utility>

namespace platform {

namespace {

/// A finger's speed is that of its last moment: who stops before lifting throws nothing.
constexpr base::Instant kSampled = std::chrono::milliseconds(100);

} // namespace

PanGestureRecognizer::PanGestureRecognizer(std::weak_ptr<View> view, std::function<bool(bool)> mayBegin,
                                           std::function<void(const Pan&)> handler)
    : m_view(std::move(view)), m_mayBegin(std::move(mayBegin)), m_handler(std::move(handler))
{
}

void PanGestureRecognizer::touchBegan(const Touch& touch)
{
    assertHere();
    if (m_phase != Phase::Idle)
        return;
    m_phase = Phase::Possible;
    m_start = touch;
    m_samples = {touch};
    tell(State::Down, touch);
}

void PanGestureRecognizer::touchMoved(const Touch& touch)
{
    assertHere();
    if (!isTracked(touch) || m_phase == Phase::Refused)
        return;
    const auto keepAlive = shared_from_this();
    keepSample(touch);
    if (m_phase == Phase::Panning) {
        tell(State::Moved, touch);
        return;
    }
    const double across = touch.position.x - m_start.position.x;
    const double down = touch.position.y - m_start.position.y;
    if (std::hypot(across, down) <= kSlop)
        return;
    const auto view = m_view.lock();
    const auto window = view ? view->window() : nullptr;
    if (!window || std::abs(across) > std::abs(down) || !m_mayBegin(down > 0)) {
        m_phase = Phase::Refused;
        return;
    }
    m_phase = Phase::Panning;
    m_start = touch; // what moves does not jump by the slop
    window->claimTouch(touch.id, self<GestureRecognizer>(), view);
    tell(State::Began, touch);
}

void PanGestureRecognizer::touchEnded(const Touch& touch)
{
    assertHere();
    if (!isTracked(touch))
        return;
    if (std::exchange(m_phase, Phase::Idle) != Phase::Panning)
        return;
    keepSample(touch);
    tell(State::Ended, touch, velocityAt(touch.time));
}

void PanGestureRecognizer::touchCancelled(const Touch& touch)
{
    assertHere();
    if (isTracked(touch) && std::exchange(m_phase, Phase::Idle) == Phase::Panning)
        tell(State::GaveUp, touch);
}

bool PanGestureRecognizer::isTracked(const Touch& touch) const
{
    return m_phase != Phase::Idle && touch.id == m_start.id;
}

void PanGestureRecognizer::keepSample(const Touch& touch)
{
    m_samples.push_back(touch);
    while (m_samples.size() > 2 && touch.time - m_samples.front().time > kSampled)
        m_samples.erase(m_samples.begin());
}

double PanGestureRecognizer::velocityAt(base::Instant time) const
{
    const Touch& first = m_samples.front();
    const Touch& last = m_samples.back();
    const std::chrono::duration<double> passed = time - first.time;
    return passed.count() > 0 ? (last.position.y - first.position.y) / passed.count() : 0;
}

void PanGestureRecognizer::tell(State state, const Touch& touch, double velocity)
{
    const auto handler = m_handler; // may take its view, and us, away
    handler({state, touch.position.y - m_start.position.y, velocity});
}

} // namespace platform

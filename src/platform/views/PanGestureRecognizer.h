/// A finger that goes up or down: follows it once it has gone a little way, and takes the touch away from whoever else
/// followed it, so that a drag does not press what it began on. Main queue only.
#pragma once

#include "platform/views/GestureRecognizer.h"
#include "platform/views/View.h"

#include <functional>
#include <memory>
#include <vector>

namespace platform {

class PanGestureRecognizer final : public GestureRecognizer {
public:
    /// How far, in points, a finger goes before it is a drag and no tap.
    static constexpr double kSlop = 10;

    enum class State {
        Down,   ///< the finger touches; it may become anything
        Began,  ///< it is a drag, and ours
        Moved,  ///<
        Ended,  ///< it has lifted
        GaveUp, ///< the system took it away
    };
    struct Pan {
        State state;
        double translation = 0; ///< points since it began, downwards
        double velocity = 0;    ///< points a second, downwards; what it lifts with
    };

    /// `mayBegin` is asked once a touch, with whether it goes down; `handler` is told of what follows. Both are the view's
    /// own: they hold it weakly.
    PanGestureRecognizer(std::weak_ptr<View> view, std::function<bool(bool isDownwards)> mayBegin,
                         std::function<void(const Pan&)> handler);

    void touchBegan(const Touch& touch) override;
    void touchMoved(const Touch& touch) override;
    void touchEnded(const Touch& touch) override;
    void touchCancelled(const Touch& touch) override;

private:
    enum class Phase { Idle, Possible, Panning, Refused };

    bool isTracked(const Touch& touch) const;
    void keepSample(const Touch& touch);
    double velocityAt(base::Instant time) const;
    void tell(State state, const Touch& touch, double velocity = 0);

    std::weak_ptr<View> m_view;
    std::function<bool(bool)> m_mayBegin;
    std::function<void(const Pan&)> m_handler;
    Phase m_phase = Phase::Idle;
    Touch m_start;
    std::vector<Touch> m_samples; ///< of the last moment, oldest first
};

} // namespace platform

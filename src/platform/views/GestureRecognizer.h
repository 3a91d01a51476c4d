/// A single tap: one finger that comes down and lifts near where it came down. Main queue only.
#pragma once

#include "platform/views/Touch.h"
#include "runtime/Object.h"

#include <optional>

namespace platform {

/// Sees the touches that begin in its view or below it, beside the view that was hit.
class GestureRecognizer : public runtime::Object {
public:
    virtual void touchBegan(const Touch& touch) = 0;
    virtual void touchMoved(const Touch& touch) = 0;
    virtual void touchEnded(const Touch& touch) = 0;
    virtual void touchCancelled(const Touch& touch) = 0;
};

class TapGestureRecognizer final : public GestureRecognizer {
public:
    /// How far, in points, a finger may wander and still tap: what a fingertip rolls.
    static constexpr double kSlop = 12;

    /// The action gets the recogniser as its argument.
    TapGestureRecognizer(std::weak_ptr<runtime::Object> target, runtime::Selector action);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    void touchBegan(const Touch& touch) override;
    void touchMoved(const Touch& touch) override;
    void touchEnded(const Touch& touch) override;
    void touchCancelled(const Touch& touch) override;

private:
    runtime::TargetAction m_targetAction;
    std::optional<Touch> m_start; ///< the one finger of a tap that may still come about
    int m_fingers = 0;
};

} // namespace platform

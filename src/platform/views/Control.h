/// A view that turns touches into events and sends them to targets. Main queue only.
#pragma once

#include "platform/views/View.h"

namespace platform {

enum ControlEvent : unsigned {
    kTouchDown = 1U << 0U,
    kTouchDragInside = 1U << 1U,
    kTouchDragOutside = 1U << 2U,
    kTouchUpInside = 1U << 3U,
    kTouchUpOutside = 1U << 4U,
    kTouchCancel = 1U << 5U,
    kValueChanged = 1U << 6U,
};

class Control : public View {
public:
    /// A touch that began inside counts as inside up to this many points beyond the edge: fingers cover what they press.
    static constexpr double kTrackingMargin = 20;

    using View::View;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// The target is weak; the action gets this control as its argument.
    void addTarget(const std::weak_ptr<runtime::Object>& target, const runtime::Selector& action, unsigned events);
    /// Sends the actions of every target that asked for one of `events`, in the order in which they were added.
    void sendActionsFor(unsigned events);

    bool isEnabled() const { return here(m_enabled); }
    void setEnabled(bool enabled);
    bool isHighlighted() const { return here(m_highlighted); }
    void setHighlighted(bool highlighted);

    bool passesTouchesToSuperviewRecognizers() const override { return here(m_passesTouches); }
    void setPassesTouchesToSuperviewRecognizers(bool passes) { here(m_passesTouches) = passes; }

    std::shared_ptr<View> hitTest(base::Point point) override;
    void touchBegan(const Touch& touch) override;
    void touchMoved(const Touch& touch) override;
    void touchEnded(const Touch& touch) override;
    void touchCancelled(const Touch& touch) override;

    bool canBecomeFocused() const override { return here(m_enabled); }

private:
    struct Registration {
        runtime::TargetAction targetAction;
        unsigned events;
    };

    bool isInside(const Touch& touch) const;

    std::vector<Registration> m_registrations;
    bool m_enabled = true;
    bool m_highlighted = false;
    bool m_passesTouches = true;
    std::optional<int> m_trackedTouch; ///< the finger that came down here
};

} // namespace platform

/// The root of a view tree: it takes events from the presenter, knows the first responder and the focus, and turns
/// changes of size into transitions. Main queue only.
#pragma once

#include "base/Log.h"
#include "base/Queue.h"
#include "platform/views/Screen.h"
#include "platform/views/TextMeasuring.h"
#include "platform/views/View.h"
#include "platform/views/ViewController.h"

#include <functional>
#include <map>

namespace platform {

class Presentation;

class Window final : public View, public Screen {
public:
    /// What rotating or resizing takes to settle on screen.
    static constexpr base::Instant kTransitionDuration = std::chrono::milliseconds(250);

    Window(base::MainQueue& mainQueue, base::Size size, double scale);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    // Screen: the window is the whole of it.
    base::Rect bounds() const override { return View::bounds(); }
    double scale() const override { return here(m_scale); }
    void setScale(double scale);

    /// Where words run from right to left, rows begin at the right: bars are mirrored, and so is the way of the focus.
    bool isRightToLeft() const { return here(m_isRightToLeft); }
    void setRightToLeft(bool rightToLeft);

    std::shared_ptr<Window> window() const override;
    std::shared_ptr<Responder> nextResponder() const override { return nullptr; }

    /// For views that let time pass.
    base::MainQueue& mainQueue() const { return here(m_mainQueue); }
    /// For what a program asks for in vain; it outlives the window. Without one nothing is said.
    void setLog(base::Log& log) { here(m_log) = &log; }
    base::Log* log() const { return here(m_log); }
    /// The presenter's fonts, or an estimate while there is no presenter.
    const TextMeasuring& textMeasuring() const;
    /// It outlives the window, or is taken back with null before it goes.
    void setTextMeasuring(const TextMeasuring* measuring);

    /// Its view fills the window.
    void setRootViewController(const std::shared_ptr<ViewController>& controller);
    std::shared_ptr<ViewController> rootViewController() const { return here(m_root); }
    /// Shows or hides the window: the controllers appear or disappear.
    void setVisible(bool visible);
    bool isVisible() const { return here(m_visible); }

    /// A new size: coalesced, so that one transition runs for all that is asked before the main queue's next turn.
    void requestSize(base::Size size);
    /// The transition itself, at once. Does nothing when the size is the current one.
    void transitionToSize(base::Size size);
    std::uint64_t transitionCount() const { return here(m_transitions); }

    // Events, positions in the window's coordinates.
    void touchDown(const Touch& touch);
    void touchMove(const Touch& touch);
    void touchUp(const Touch& touch);
    void touchCancel(const Touch& touch);
    void motion(MotionSubtype subtype);
    /// Offers a key to the focused view and the responder chain; true when somebody took it.
    bool keyDown(Key key, char character = 0, bool control = false, bool shift = false);
    /// A wheel or two fingers over a place; up if positive. True when something moved.
    bool scroll(base::Point position, double points);
    /// From now on the touch is `recognizer`'s alone, which is one of `view`'s: whoever else follows it is told that it was
    /// cancelled.
    void claimTouch(int id, const std::shared_ptr<GestureRecognizer>& recognizer, const std::shared_ptr<View>& view);

    // First responder.
    std::shared_ptr<Responder> firstResponder() const { return here(m_firstResponder).lock(); }
    void setFirstResponder(const std::shared_ptr<Responder>& responder);

    // What is presented above all else. Touches, keys, the focus and assistive technology stay in the topmost.
    /// Null when nothing is presented.
    std::shared_ptr<Presentation> topPresentation() const;
    /// For presentations: the window's list, the topmost last.
    void pushPresentation(const std::shared_ptr<Presentation>& presentation);
    void popPresentation(const Presentation& presentation);

    // Keyboard focus: Tab order is the order of drawing, top to bottom, leading to trailing.
    std::shared_ptr<View> focusedView() const;
    void moveFocus(bool forward);
    void clearFocus();
    /// Back to a view that had it; nowhere when it cannot be reached any more.
    void restoreFocus(const std::shared_ptr<View>& view);

    // For the presenter.
    /// Called once when the tree stops being what was last committed; again only after `commit()`.
    void setNeedsCommitHandler(std::function<void()> handler) { here(m_needsCommitHandler) = std::move(handler); }
    /// Lays out what needs it; the presenter mirrors the tree right after.
    void commit();
    void noteChange();
    /// The root controller's view fills the window.
    void layoutSubviews() override;

private:
    struct Tracking {
        Touch last;
        std::weak_ptr<View> view;
        std::vector<std::weak_ptr<GestureRecognizer>> recognizers;
    };

    friend class View;

    void cancelTouch(int id);
    /// Forgets the focus and the first responder when they are out of the window, the former also when it is hidden.
    void forgetStrays();
    void focus(const std::shared_ptr<View>& view);
    std::vector<std::shared_ptr<View>> focusableViews() const;
    bool isReachable(const std::shared_ptr<View>& view) const;
    /// Where keys and shakes begin their way: the first responder, unless something is presented that it is not a part of.
    std::shared_ptr<Responder> responderForKeys() const;
    bool moveFocusByArrow(Key key);

    base::MainQueue& m_mainQueue;
    double m_scale;
    std::shared_ptr<ViewController> m_root;
    bool m_visible = false;
    bool m_isRightToLeft = false;
    std::optional<base::Size> m_requestedSize;
    std::uint64_t m_transitions = 0;
    base::Log* m_log = nullptr;
    const TextMeasuring* m_textMeasuring = nullptr;
    std::vector<std::weak_ptr<Presentation>> m_presentations; ///< the topmost last
    std::map<int, Tracking> m_touches;
    std::weak_ptr<Responder> m_firstResponder;
    std::weak_ptr<View> m_focusedView;
    std::function<void()> m_needsCommitHandler;
    bool m_needsCommit = true;
};

/// Of the window that `view` is in, or an estimate outside of one.
const TextMeasuring& textMeasuringFor(const View& view);

} // namespace platform

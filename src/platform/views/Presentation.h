/// Shows one controller above all that stands in a window: as a sheet that slides up, a popover with an arrow at what it
/// came from, or an alert in the middle. Main queue only.
///
/// It is made and kept by the controller that presents (see ViewController), and stands in the window itself, above the
/// root controller's view. While it does, touches, keys, the focus and assistive technology stay inside it; when it has
/// gone, the focus and the first responder are where they were.
#pragma once

#include "platform/views/BarButtonItem.h"
#include "platform/views/PanGestureRecognizer.h"
#include "platform/views/SurfaceView.h"
#include "platform/views/ViewController.h"

#include <functional>
#include <memory>
#include <optional>
#include <vector>

namespace platform {

class Presentation final : public View {
public:
    /// What sliding up or down takes, and what fading does.
    static constexpr base::Instant kSlideDuration = std::chrono::milliseconds(250);
    static constexpr base::Instant kFadeDuration = std::chrono::milliseconds(150);

    using Completion = std::function<void()>;

    Presentation(const std::shared_ptr<ViewController>& presenting, std::shared_ptr<ViewController> presented);

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    const std::shared_ptr<ViewController>& presented() const { return here(m_presented); }

    /// Comes into `window`; `shown` runs on the main queue when it is all there.
    void begin(Window& window, bool animated, Completion shown);
    /// Leaves; `gone` runs on the main queue when nothing is left of it. What has not come yet comes first.
    void end(bool animated, Completion gone);
    /// The same, as the user does it: what is presented may take its time.
    void close(Completion gone);
    /// Leaves at once, and tells nobody but the presented controller's view: for a presenter that goes itself.
    void abandon();

    /// On its way up or down: what is touched or typed then does not reach it.
    bool isMoving() const { return here(m_phase) == Phase::Coming || m_phase == Phase::Leaving; }
    /// What is presented would like another size. On its way up it grows or shrinks to it; what is up already does so
    /// without any motion.
    void contentSizeDidChange();
    /// Stays at what it came from. For the window, with each picture.
    void followSource();

    /// What stands in the middle of the window, or slides up: the presented view is in it.
    const std::shared_ptr<SurfaceView>& surface() const { return here(m_surface); }

    void layoutSubviews() override;
    bool canBecomeFirstResponder() const override { return true; }
    std::vector<KeyCommand> keyCommands() const override;

    // What the user does.
    void tapBeside();
    void escape();

private:
    enum class Phase { Waiting, Coming, Shown, Leaving, Gone };
    base::Instant duration(bool animated) const;
    void motionDidEnd();
    void didShow();
    void place();
    void placeInMotion();
    void closeForUser();
    void leave(bool animated);
    void didLeave();
    void drag(const PanGestureRecognizer::Pan& pan);
    std::optional<base::Rect> sourceRect() const;
    base::Rect sheetFrame() const;
    base::Rect alertFrame() const;
    base::Rect popoverFrame();

    std::weak_ptr<ViewController> m_presenting;
    std::shared_ptr<ViewController> m_presented;
    std::weak_ptr<BarButtonItem> m_source;
    ModalPresentationStyle m_style;
    std::shared_ptr<View> m_dim;
    std::shared_ptr<SurfaceView> m_surface;
    std::shared_ptr<SurfaceView> m_grabber;
    std::optional<base::Rect> m_anchor; ///< where the source was when it was laid out last
    Phase m_phase = Phase::Waiting;
    bool m_isUp = false;
    bool m_isAnimated = false;
    bool m_takesSizes = true; ///< on its way up
    int m_motions = 0;        ///< that go on, on its way up
    Completion m_shownHandler;
    bool m_closesWhenShown = false;
    double m_dragged = 0;             ///< down, by a finger
    std::optional<bool> m_waitingEnd; ///< whether it is to be animated
    std::vector<Completion> m_goneHandlers;
    std::weak_ptr<View> m_formerFocus;
    std::weak_ptr<Responder> m_formerResponder;
};

} // namespace platform

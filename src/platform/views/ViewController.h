/// Owns a view and what it shows; can hold other controllers as children. Main queue only.
///
/// Appearance follows the window: a controller whose view comes into a visible tree gets viewWillAppear and
/// viewDidAppear, one whose view leaves it the two opposite calls, each once.
#pragma once

#include "base/Affinity.h"
#include "platform/views/View.h"

#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace platform {

/// Lets controllers change things together with a change of size.
class TransitionCoordinator {
public:
    using Block = std::function<void()>;

    explicit TransitionCoordinator(base::Instant duration) : m_duration(duration) {}

    base::Instant duration() const
    {
        m_affinity.assertHere();
        return m_duration;
    }
    /// `alongside` runs once the new size is in force, inside the transition's animation; `completion` after it.
    void animateAlongsideTransition(Block alongside, Block completion);

    // For the window that runs the transition.
    void runAlongside();
    void runCompletions();

private:
    base::Affinity m_affinity;
    base::Instant m_duration;
    std::vector<Block> m_alongside;
    std::vector<Block> m_completions;
};

class BarButtonItem;
class Presentation;

/// How a controller is shown above the others.
enum class ModalPresentationStyle {
    Sheet = 0,   ///< slides up from the bottom
    Alert = 1,   ///< stands in the middle, and does not go away by a tap beside it
    Popover = 7, ///< stands at what it came from, with an arrow
};

class ViewController : public Responder {
public:
    ViewController() = default;
    ~ViewController() override;

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// Loads the view on first use: loadView, then viewDidLoad.
    std::shared_ptr<View> view();
    bool isViewLoaded() const { return here(m_view) != nullptr; }
    void setView(std::shared_ptr<View> view);

    // Containment. A parent adds the child, puts its view among its own and then says that it did move; it says that it
    // will move to none, takes the view out and then removes the child. Any other order fails an assertion.
    std::shared_ptr<ViewController> parent() const { return here(m_parent).lock(); }
    const std::vector<std::shared_ptr<ViewController>>& childViewControllers() const { return here(m_children); }
    void addChildViewController(const std::shared_ptr<ViewController>& child);
    void removeFromParentViewController();
    /// Said to the child when it is added; its parent says that it will move to none. An override calls this.
    virtual void willMoveToParentViewController(ViewController* parent);
    /// Said to the child when it has been removed; its parent says that it did move. An override calls this.
    virtual void didMoveToParentViewController(ViewController* parent);

    // Lifecycle.
    /// By default a plain view of flexible size.
    virtual void loadView();
    virtual void viewDidLoad() {}
    virtual void viewWillAppear(bool /*animated*/) {}
    virtual void viewDidAppear(bool /*animated*/) {}
    virtual void viewWillDisappear(bool /*animated*/) {}
    virtual void viewDidDisappear(bool /*animated*/) {}
    virtual void viewDidLayoutSubviews() {}
    /// By default handed on to the children.
    virtual void viewWillTransitionToSize_withTransitionCoordinator(base::Size size,
                                                                    TransitionCoordinator& coordinator);

    // Presentation.
    /// Shows `controller` above all that stands in the window, as its style says. `completion` runs on the main queue when
    /// it is fully on screen. A controller that presents already, or is in no window, only says so in the log.
    void present(const std::shared_ptr<ViewController>& controller, bool animated,
                 std::function<void()> completion = {});
    /// Takes away what this presents or, if that is nothing, this itself from who presents it. What is still on its way up
    /// comes first. `completion` runs on the main queue when it is gone.
    void dismiss(bool animated, std::function<void()> completion = {});
    /// As the user closes what this presents, with all that stands above it: whoever is in the middle of something ends that
    /// first. `completion` runs on the main queue when nothing is presented any more; at once when nothing is.
    void closePresented(std::function<void()> completion);
    /// Null when there is none. Both stay until all is off the screen.
    std::shared_ptr<ViewController> presentedViewController() const;
    std::shared_ptr<ViewController> presentingViewController() const { return here(m_presenting).lock(); }

    ModalPresentationStyle modalPresentationStyle() const { return here(m_modalStyle); }
    void setModalPresentationStyle(ModalPresentationStyle style) { here(m_modalStyle) = style; }
    /// What a popover's arrow points at; the popover stands in the middle while that is nowhere on the screen. Weak.
    std::shared_ptr<BarButtonItem> popoverSource() const { return here(m_popoverSource).lock(); }
    void setPopoverSource(const std::weak_ptr<BarButtonItem>& source) { here(m_popoverSource) = source; }
    /// What assistive technology calls it while it is presented.
    const std::string& title() const { return here(m_title); }
    void setTitle(std::string title) { here(m_title) = std::move(title); }
    /// How large it would like to be where there is so much room; all of it by default. Asked with each layout.
    virtual base::Size contentSizeThatFits(base::Size room);
    /// For the presented one, when it would like another size than it said.
    void contentSizeDidChange();
    /// Where keys go first while it is presented; null: to what stands first.
    virtual std::shared_ptr<View> preferredFocusView() { return nullptr; }
    /// Said to the presented one before the completion: it is fully on screen.
    virtual void presentationDidShow() {}
    /// The user wants it away, by Esc, a swipe or a tap beside it. Whoever says no may dismiss itself later.
    virtual bool presentationShouldClose() { return true; }
    /// Said to the presented one when it is gone, whoever wanted it so, and then to who presented it.
    virtual void presentationDidEnd() {}
    virtual void presentedViewControllerDidEnd(ViewController& /*presented*/) {}

    bool hasAppeared() const { return here(m_appeared); }
    std::shared_ptr<Responder> nextResponder() const override;
    std::shared_ptr<Window> window() const override;

    // For presentations, and for windows whose root goes.
    void forgetPresentation(const Presentation& presentation);
    /// Takes away at once what this presents, and tells nobody.
    void abandonPresented();

    // For views and windows.
    /// Calls what is due of this controller and of those whose views stand in its view; nothing when that is so already.
    void setAppeared(bool appeared);
    /// The two halves of disappearing, for a view that leaves its place in between: adds to `leaving` who was told.
    void beginDisappearing(std::vector<std::shared_ptr<ViewController>>& leaving);
    static void endDisappearing(const std::vector<std::shared_ptr<ViewController>>& leaving);

private:
    bool isViewInParents() const;
    void leaveParent();

    std::shared_ptr<View> m_view;
    std::weak_ptr<ViewController> m_parent;
    bool m_moving = false; ///< between what it is told before and what after
    std::vector<std::shared_ptr<ViewController>> m_children;
    bool m_appeared = false;
    std::shared_ptr<Presentation> m_presentation; ///< of what this presents
    std::weak_ptr<ViewController> m_presenting;
    ModalPresentationStyle m_modalStyle = ModalPresentationStyle::Sheet;
    std::weak_ptr<BarButtonItem> m_popoverSource;
    std::string m_title;
};

} // namespace platform

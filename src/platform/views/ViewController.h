/// Owns a view and what it shows; can hold other controllers as children. Main queue only.
///
/// Appearance follows the window: a controller whose view comes into a visible tree gets viewWillAppear and
/// viewDidAppear, one whose view leaves it the two opposite calls, each once.
#pragma once

#include "base/Affinity.h"
#include "platform/views/View.h"

#include <functional>
#include <memory>
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

    bool hasAppeared() const { return here(m_appeared); }
    std::shared_ptr<Responder> nextResponder() const override;
    std::shared_ptr<Window> window() const override;

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
};

} // namespace platform

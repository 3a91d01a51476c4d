#include "platform/views/ViewController.h"

#include "platform/views/Window.h"

#include <algorithm>
#include <cassert>
#include <utility>

namespace platform {

void TransitionCoordinator::animateAlongsideTransition(Block alongside, Block completion)
{
    m_affinity.assertHere();
    if (alongside)
        m_alongside.push_back(std::move(alongside));
    if (completion)
        m_completions.push_back(std::move(completion));
}

void TransitionCoordinator::runAlongside()
{
    m_affinity.assertHere();
    while (!m_alongside.empty())
        for (const Block& block : std::exchange(m_alongside, {}))
            block();
}

void TransitionCoordinator::runCompletions()
{
    m_affinity.assertHere();
    for (const Block& block : std::exchange(m_completions, {}))
        block();
}

ViewController::~ViewController()
{
    assertHere();
    abandonPresented();
}

const runtime::Class& ViewController::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<ViewController>("ViewController", &Responder::classObject()).build();
    return instance;
}

const runtime::Class& ViewController::isa() const
{
    return classObject();
}

std::shared_ptr<View> ViewController::view()
{
    assertHere();
    if (!m_view) {
        loadView();
        assert(m_view);
        viewDidLoad();
    }
    return m_view;
}

void ViewController::setView(std::shared_ptr<View> view)
{
    assertHere();
    if (m_view)
        m_view->setViewController({});
    m_view = std::move(view);
    if (m_view)
        m_view->setViewController(weakSelf<ViewController>());
}

void ViewController::loadView()
{
    assertHere();
    auto view = std::make_shared<View>();
    view->setAutoresizingMask(kFlexibleWidth | kFlexibleHeight);
    setView(std::move(view));
}

void ViewController::addChildViewController(const std::shared_ptr<ViewController>& child)
{
    assertHere();
    assert(child && child.get() != this);
    if (child->parent().get() == this)
        return;
    child->willMoveToParentViewController(this);
    child->leaveParent();
    m_children.push_back(child);
    child->m_parent = weakSelf<ViewController>();
}

void ViewController::removeFromParentViewController()
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (parent()) {
        assert(m_moving && !isViewInParents());
        leaveParent();
        didMoveToParentViewController(nullptr);
    }
}

void ViewController::leaveParent()
{
    if (const auto former = parent())
        std::erase_if(former->m_children,
                      [this](const std::shared_ptr<ViewController>& each) { return each.get() == this; });
    m_parent.reset();
}

bool ViewController::isViewInParents() const
{
    const auto above = parent();
    return above && m_view && above->m_view && m_view->isDescendantOf(*above->m_view);
}

void ViewController::willMoveToParentViewController([[maybe_unused]] ViewController* parent)
{
    assertHere();
    assert(!m_moving && (parent || isViewInParents()));
    m_moving = true;
}

void ViewController::didMoveToParentViewController([[maybe_unused]] ViewController* parent)
{
    assertHere();
    assert(m_moving && parent == this->parent().get() && (!parent || isViewInParents()));
    m_moving = false;
}

void ViewController::viewWillTransitionToSize_withTransitionCoordinator(base::Size size,
                                                                        TransitionCoordinator& coordinator)
{
    assertHere();
    const auto children = m_children;
    for (const auto& child : children)
        child->viewWillTransitionToSize_withTransitionCoordinator(size, coordinator);
}

std::shared_ptr<Responder> ViewController::nextResponder() const
{
    assertHere();
    if (m_view)
        if (auto above = m_view->superview())
            return above;
    return parent();
}

std::shared_ptr<Window> ViewController::window() const
{
    assertHere();
    return m_view ? m_view->window() : nullptr;
}

void ViewController::setAppeared(bool appeared)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (!appeared) {
        std::vector<std::shared_ptr<ViewController>> leaving;
        beginDisappearing(leaving);
        endDisappearing(leaving);
        return;
    }
    if (m_appeared)
        return;
    const auto itsView = view();
    // Before anybody is told: a child whose view is added meanwhile appears then and there, and not once more below.
    m_appeared = true;
    viewWillAppear(false);
    for (const auto& each : itsView->subviews())
        if (m_appeared)
            each->appearControllers();
    if (m_appeared)
        viewDidAppear(false);
}

void ViewController::beginDisappearing(std::vector<std::shared_ptr<ViewController>>& leaving)
{
    assertHere();
    if (!m_appeared)
        return;
    m_appeared = false;
    leaving.push_back(self<ViewController>());
    viewWillDisappear(false);
    if (m_view)
        for (const auto& each : m_view->subviews())
            for (const auto& controller : each->topControllers())
                controller->beginDisappearing(leaving);
}

void ViewController::endDisappearing(const std::vector<std::shared_ptr<ViewController>>& leaving)
{
    for (auto controller = leaving.rbegin(); controller != leaving.rend(); ++controller)
        if (!(*controller)->m_appeared)
            (*controller)->viewDidDisappear(false);
}

} // namespace platform

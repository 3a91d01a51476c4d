// What a controller shows above all else, and what it is shown by.
#include "platform/views/Presentation.h"
#include "platform/views/ViewController.h"
#include "platform/views/Window.h"

#include <cassert>
#include <utility>

namespace platform {

void ViewController::present(const std::shared_ptr<ViewController>& controller, bool animated,
                             std::function<void()> completion)
{
    assertHere();
    assert(controller && controller.get() != this);
    const auto itsWindow = window();
    if (m_presentation || !itsWindow || controller->presentingViewController()) {
        if (itsWindow && itsWindow->log())
            itsWindow->log()->error(m_presentation ? "a controller that presents already cannot present another one"
                                                   : "a controller that is presented already cannot be presented");
        return;
    }
    const auto keepAlive = shared_from_this();
    m_presentation = std::make_shared<Presentation>(self<ViewController>(), controller);
    controller->m_presenting = weakSelf<ViewController>();
    const auto presentation = m_presentation;
    presentation->begin(*itsWindow, animated, std::move(completion));
}

void ViewController::dismiss(bool animated, std::function<void()> completion)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (const auto presentation = m_presentation)
        presentation->end(animated, std::move(completion));
    else if (const auto presenting = presentingViewController())
        presenting->dismiss(animated, std::move(completion));
    else if (const auto itsWindow = completion ? window() : nullptr)
        itsWindow->mainQueue().post(std::move(completion));
}

void ViewController::closePresented(std::function<void()> completion)
{
    assertHere();
    const auto keepAlive = shared_from_this();
    if (const auto presentation = m_presentation)
        presentation->close(std::move(completion));
    else
        completion();
}

std::shared_ptr<ViewController> ViewController::presentedViewController() const
{
    assertHere();
    return m_presentation ? m_presentation->presented() : nullptr;
}

void ViewController::abandonPresented()
{
    assertHere();
    if (const auto presentation = m_presentation) {
        presentation->abandon();
        forgetPresentation(*presentation);
    }
}

void ViewController::forgetPresentation(const Presentation& presentation)
{
    assertHere();
    if (m_presentation.get() != &presentation)
        return;
    const auto former = std::exchange(m_presentation, nullptr);
    former->presented()->m_presenting.reset();
}

void ViewController::contentSizeDidChange()
{
    assertHere();
    if (const auto presenting = presentingViewController())
        presenting->m_presentation->contentSizeDidChange();
}

base::Size ViewController::contentSizeThatFits(base::Size room)
{
    assertHere();
    return room;
}

} // namespace platform

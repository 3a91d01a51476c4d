#include "platform/views/Responder.h"

#include "platform/views/Window.h"

namespace platform {

const runtime::Class& Responder::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<Responder>("Responder", &runtime::Object::classObject()).build();
    return instance;
}

const runtime::Class& Responder::isa() const
{
    return classObject();
}

bool Responder::becomeFirstResponder()
{
    assertHere();
    const auto itsWindow = window();
    if (!itsWindow || !canBecomeFirstResponder())
        return false;
    itsWindow->setFirstResponder(self<Responder>());
    return true;
}

void Responder::resignFirstResponder()
{
    assertHere();
    if (isFirstResponder())
        window()->setFirstResponder(nullptr);
}

bool Responder::isFirstResponder() const
{
    assertHere();
    const auto itsWindow = window();
    return itsWindow && itsWindow->firstResponder().get() == this;
}

void Responder::motionEnded_withEvent(MotionSubtype motion, const MotionEvent& event)
{
    assertHere();
    if (const auto next = nextResponder())
        next->motionEnded_withEvent(motion, event);
}

} // namespace platform

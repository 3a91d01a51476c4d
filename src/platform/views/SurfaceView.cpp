#include "platform/views/SurfaceView.h"

namespace platform {

const runtime::Class& SurfaceView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<SurfaceView>("SurfaceView", &View::classObject()).build();
    return instance;
}

const runtime::Class& SurfaceView::isa() const
{
    return classObject();
}

void SurfaceView::setArrow(Arrow arrow)
{
    assertHere();
    if (m_arrow == arrow)
        return;
    m_arrow = arrow;
    setNeedsDisplay();
}

Accessibility SurfaceView::accessibility() const
{
    assertHere();
    Accessibility description = View::accessibility();
    if (m_style == Style::Sheet || m_style == Style::Popover || m_style == Style::Alert)
        description.role = AccessibilityRole::Dialog;
    return description;
}

} // namespace platform

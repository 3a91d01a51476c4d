#include "platform/views/BackdropView.h"

#include <algorithm>

namespace platform {

BackdropView::BackdropView(int style, base::Rect frame) : View(frame), m_style(style) {}

const runtime::Class& BackdropView::classObject()
{
    static const runtime::Class& instance =
        runtime::ClassBuilder<BackdropView>("BackdropView", &View::classObject()).build();
    return instance;
}

const runtime::Class& BackdropView::isa() const
{
    return classObject();
}

void BackdropView::updateMaskViewsFor(const std::shared_ptr<View>& view)
{
    assertHere();
    if (!view)
        return;
    const auto isGone = [](const std::weak_ptr<View>& each) { return each.expired(); };
    const auto isView = [&](const std::weak_ptr<View>& each) { return each.lock() == view; };
    std::erase_if(m_maskViews, isGone);
    const bool isMask = std::any_of(m_maskViews.begin(), m_maskViews.end(), isView);
    const bool shallBeMask = view->backdropMaskFlags() != 0;
    if (shallBeMask && !isMask)
        m_maskViews.push_back(view);
    else if (!shallBeMask && isMask)
        std::erase_if(m_maskViews, isView);
    setNeedsDisplay();
}

std::vector<std::shared_ptr<View>> BackdropView::maskViews() const
{
    assertHere();
    std::vector<std::shared_ptr<View>> views;
    for (const auto& each : m_maskViews)
        if (auto view = each.lock())
            views.push_back(std::move(view));
    return views;
}

} // namespace platform

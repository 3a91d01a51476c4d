/// Shows a toolbar's ground: what lies behind it, blurred and nearly covered, with a hairline toward the content.
#pragma once

#include "linux/qt/items/Blur.h"
#include "linux/qt/items/ViewItem.h"

namespace qtui {

class ToolbarItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
    bool needsDrawing(platform::View& view, bool visible) override;

private:
    Blur m_blur;
};

} // namespace qtui

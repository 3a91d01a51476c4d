/// Shows a label: one line in the middle of its frame's height, or several from its top. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

namespace qtui {

class LabelItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
    /// Where rows begin is the window's.
    bool needsDrawing(platform::View& view, bool visible) override;

private:
    bool m_drawnRightToLeft = false;
};

} // namespace qtui

/// Shows a label: one line, in the middle of its frame's height. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

namespace qtui {

class LabelItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
};

} // namespace qtui

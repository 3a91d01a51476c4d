/// Shows an image view: its picture, stretched over its frame. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

namespace qtui {

class ImageItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
};

} // namespace qtui

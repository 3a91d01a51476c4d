/// Show what stands on the scrubber's strip: the play head, and the frame with its two grips. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

namespace qtui {

class PlayHeadItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
};

/// Outside editing only the grips' marks: what they stand on is the strip's own.
class TrimFrameItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
};

} // namespace qtui

/// Shows a backdrop: a live blur of what lies behind, in its frame or in the shape that its mask views give. GUI thread.
#pragma once

#include "linux/qt/items/Blur.h"
#include "linux/qt/items/ViewItem.h"
#include "platform/views/BackdropView.h"
#include "platform/views/Image.h"

namespace qtui {

class BackdropItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

    /// Its frame or, without one, what its mask views cover together.
    base::Rect modelFrame(const platform::View& view) const override;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
    bool needsDrawing(platform::View& view, bool visible) override;

private:
    /// What a mask view was like when the mask was drawn.
    struct Mask {
        base::Rect frame; ///< in the backdrop's coordinates
        platform::ImageRef image;
        unsigned flags = 0;
        friend bool operator==(const Mask&, const Mask&) = default;
    };

    std::vector<Mask> masksOf(const platform::BackdropView& backdrop) const;
    QImage masked(const QImage& blur) const;
    QColor tint(const platform::BackdropView& backdrop) const;

    Blur m_blur;
    std::vector<Mask> m_masks;
};

} // namespace qtui

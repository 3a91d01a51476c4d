/// Shows a surface: the ground of a sheet, a popover or an alert, and the small marks of lists and progress. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"
#include "platform/views/SurfaceView.h"

#include <QPainterPath>

namespace qtui {

class SurfaceItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;

private:
    std::vector<Sprite> sheet() const;
    std::vector<Sprite> floating(const platform::SurfaceView& surface) const;
    Sprite rounded(const QColor& color) const;
    QPainterPath outline(const platform::SurfaceView& surface) const;
};

} // namespace qtui

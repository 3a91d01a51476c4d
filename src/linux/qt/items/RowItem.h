/// Shows a row of a list: its glyph or image, its title on up to two lines, and a ground while it is pressed. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"
#include "platform/views/ListRow.h"

namespace qtui {

class RowItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
    /// The tint colour comes from above, and where rows begin is the window's.
    bool needsDrawing(platform::View& view, bool visible) override;

private:
    QColor tint(const platform::View& view) const;
    /// The place that begins so far from where rows begin.
    QRectF placed(double start, double width) const;
    void drawIcon(const platform::ListRow& row, std::vector<Sprite>& sprites) const;
    void drawTitle(const platform::ListRow& row, std::vector<Sprite>& sprites) const;

    QColor m_drawnTint;
    bool m_rightToLeft = false;
};

} // namespace qtui

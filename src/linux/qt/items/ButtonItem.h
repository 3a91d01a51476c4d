/// Shows a button: its picture, its glyph or its title, by state. GUI thread.
#pragma once

#include "linux/qt/items/ViewItem.h"

namespace qtui {

class ButtonItem final : public ViewItem {
public:
    using ViewItem::ViewItem;

protected:
    std::vector<Sprite> draw(platform::View& view) override;
    /// The tint colour comes from above.
    bool needsDrawing(platform::View& view, bool visible) override;

private:
    QColor tint(const platform::View& view) const;

    QColor m_drawnTint;
};

} // namespace qtui

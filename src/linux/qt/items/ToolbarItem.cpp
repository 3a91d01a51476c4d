#include "linux/qt/items/ToolbarItem.h"

namespace qtui {

bool ToolbarItem::needsDrawing(platform::View&, bool visible)
{
    assertHere();
    return visible && stage().liveBlur && m_blur.isStale(stage(), windowRect(), stage().material(stage().theme.bar));
}

std::vector<Sprite> ToolbarItem::draw(platform::View& view)
{
    assertHere();
    std::vector<Sprite> sprites;
    const QColor bar = stage().material(stage().theme.bar);
    if (stage().liveBlur) {
        if (m_blur.isStale(stage(), windowRect(), bar))
            m_blur.update(stage(), windowRect(), bar);
        sprites.push_back({ownRect(), {}, m_blur.image(), true});
    } else {
        sprites.push_back({ownRect(), bar, {}, false});
    }
    const auto above = view.superview();
    const bool atTop = !above || view.center().y < above->bounds().height() / 2;
    const double hairline = 1 / stage().scale;
    const double y = atTop ? ownRect().bottom() - hairline : 0;
    sprites.push_back({{0, y, ownRect().width(), hairline}, stage().theme.hairline, {}, false});
    return sprites;
}

} // namespace qtui

#include "linux/qt/items/ViewItem.h"

namespace qtui {

void ViewItem::refresh(platform::View& view, bool visible)
{
    assertHere();
    setClip(view.clipsToBounds());
    const bool asks = needsDrawing(view, visible);
    if (!asks && m_revision == view.revision() && m_generation == stage().generation && m_drawnSize == shownSize())
        return;
    m_revision = view.revision();
    m_generation = stage().generation;
    m_drawnSize = shownSize();
    ++stage().statistics.drawings;
    setSprites(draw(view));
}

std::vector<Sprite> ViewItem::draw(platform::View& view)
{
    assertHere();
    return {{ownRect(), toQColor(view.backgroundColor()), {}, false}};
}

} // namespace qtui

#include "linux/qt/items/ImageItem.h"

#include "linux/qt/items/Bitmaps.h"
#include "platform/views/ImageView.h"

namespace qtui {

std::vector<Sprite> ImageItem::draw(platform::View& view)
{
    assertHere();
    std::vector<Sprite> sprites = ViewItem::draw(view);
    const QImage picture = toQImage(dynamic_cast<const platform::ImageView&>(view).image());
    if (picture.isNull())
        return sprites;
    const bool stretched = QSizeF(picture.size()) != ownRect().size() * stage().scale;
    sprites.push_back({ownRect(), {}, picture, stretched});
    return sprites;
}

} // namespace qtui

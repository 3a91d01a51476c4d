#include "linux/qt/items/LabelItem.h"

#include "linux/qt/items/Text.h"
#include "platform/views/Label.h"

namespace qtui {

namespace {

Qt::Alignment toQt(platform::TextAlignment alignment)
{
    switch (alignment) {
    case platform::TextAlignment::Center:
        return Qt::AlignHCenter;
    case platform::TextAlignment::Right:
        return Qt::AlignRight;
    case platform::TextAlignment::Left:
        break;
    }
    return Qt::AlignLeft;
}

} // namespace

std::vector<Sprite> LabelItem::draw(platform::View& view)
{
    assertHere();
    const auto& label = dynamic_cast<const platform::Label&>(view);
    std::vector<Sprite> sprites = ViewItem::draw(view);
    if (label.text().empty() || ownRect().width() <= 0)
        return sprites;
    const TextLine line = fitted(
        {QString::fromStdString(label.text()).simplified(), systemFont(label.fontSize()), toQt(label.textAlignment())},
        ownRect().width());
    const QColor color = stage().theme.label(label.textColor());
    sprites.push_back(paintedSprite(textArea(line, ownRect()), stage().scale, [&](QPainter& painter) {
        drawText(painter, line, ownRect(), color, stage().scale);
    }));
    return sprites;
}

} // namespace qtui

#include "linux/qt/items/LabelItem.h"

#include "linux/qt/items/Text.h"
#include "platform/views/Label.h"
#include "platform/views/Window.h"

#include <algorithm>

namespace qtui {

namespace {

Qt::Alignment toQt(platform::TextAlignment alignment, bool rightToLeft)
{
    switch (alignment) {
    case platform::TextAlignment::Center:
        return Qt::AlignHCenter;
    case platform::TextAlignment::Right:
        return Qt::AlignRight;
    case platform::TextAlignment::Leading:
        return rightToLeft ? Qt::AlignRight : Qt::AlignLeft;
    case platform::TextAlignment::Left:
        break;
    }
    return Qt::AlignLeft;
}

bool runsRightToLeft(const platform::View& view)
{
    const auto window = view.window();
    return window && window->isRightToLeft();
}

} // namespace

bool LabelItem::needsDrawing(platform::View& view, bool)
{
    assertHere();
    const auto& label = dynamic_cast<const platform::Label&>(view);
    return label.textAlignment() == platform::TextAlignment::Leading && runsRightToLeft(view) != m_drawnRightToLeft;
}

std::vector<Sprite> LabelItem::draw(platform::View& view)
{
    assertHere();
    const auto& label = dynamic_cast<const platform::Label&>(view);
    std::vector<Sprite> sprites = ViewItem::draw(view);
    m_drawnRightToLeft = runsRightToLeft(view);
    if (label.text().empty() || ownRect().width() <= 0)
        return sprites;
    const QFont font = systemFont(label.fontSize(), label.isEmphasized() ? QFont::DemiBold : QFont::Normal);
    const Qt::Alignment alignment = toQt(label.textAlignment(), m_drawnRightToLeft);
    const QColor color = stage().theme.label(label.textColor());
    const QString text = QString::fromStdString(label.text());
    if (label.numberOfLines() == 1) {
        const TextLine line = fitted({text.simplified(), font, alignment}, ownRect().width());
        sprites.push_back(paintedSprite(textArea(line, ownRect()), stage().scale, [&](QPainter& painter) {
            drawText(painter, line, ownRect(), color, stage().scale);
        }));
        return sprites;
    }
    const double height = lineHeight(font);
    // Where the frame is lower than the text wants to be, whole lines are left out.
    const int fitting = std::max(1, static_cast<int>(ownRect().height() / height));
    const int most = label.numberOfLines() > 0 ? std::min(label.numberOfLines(), fitting) : fitting;
    QRectF frame(0, 0, ownRect().width(), height);
    for (const QString& each : wrapped(text, font, ownRect().width(), most)) {
        const TextLine line{each, font, alignment};
        sprites.push_back(paintedSprite(textArea(line, frame), stage().scale, [&](QPainter& painter) {
            drawText(painter, line, frame, color, stage().scale);
        }));
        frame.translate(0, height);
    }
    return sprites;
}

} // namespace qtui

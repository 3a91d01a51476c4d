#include "linux/qt/items/ScrubberPartItems.h"

#include "platform/views/ScrubberParts.h"

#include <QPainter>
#include <QPainterPath>

namespace qtui {

namespace {

constexpr double kHeadWidth = 4;
constexpr double kHeadOutline = 1;
constexpr double kKnobRadius = 8;
constexpr double kKnobRadiusHeld = 10;
constexpr double kKnobBorder = 4.5;

constexpr double kFrameMargin = 1; ///< to the strip's edges, for the outline
constexpr double kFrameBorder = 3; ///< above and below the pictures
constexpr double kFrameCorner = 8;
constexpr double kFrameInnerCorner = 2;
constexpr double kMarkWidth = 3;
constexpr double kMarkHeight = 14;
constexpr double kMarkHeightHeld = 20;

const QColor kOutline(0, 0, 0, 190);
const QColor kIdleMark(255, 255, 255, 200); // stands on the strip's dark ground in both schemes

/// In the middle of a grip, on whole pixels.
QRectF markIn(const QRectF& grip, bool held, const Stage& stage)
{
    const double height = held ? kMarkHeightHeld : kMarkHeight;
    const QPointF corner = stage.snapped(QPointF(grip.center().x() - kMarkWidth / 2, grip.center().y() - height / 2));
    return {corner, QSizeF(kMarkWidth, height)};
}

void drawMark(QPainter& painter, const QRectF& mark, const QColor& color)
{
    painter.setPen(Qt::NoPen);
    painter.setBrush(color);
    painter.drawRoundedRect(mark, kMarkWidth / 2, kMarkWidth / 2);
}

} // namespace

std::vector<Sprite> PlayHeadItem::draw(platform::View& view)
{
    assertHere();
    const bool held = dynamic_cast<const platform::PlayHeadView&>(view).isHeld();
    const double radius = held ? kKnobRadiusHeld : kKnobRadius;
    const QPointF center = ownRect().center();
    return {paintedSprite(ownRect(), stage().scale, [&](QPainter& painter) {
        const QRectF bar(center.x() - kHeadWidth / 2, kHeadOutline, kHeadWidth, ownRect().height() - 2 * kHeadOutline);
        QPainterPath shape;
        shape.setFillRule(Qt::WindingFill);
        shape.addRoundedRect(bar, kHeadWidth / 2, kHeadWidth / 2);
        shape.addEllipse(center, radius, radius);
        const QPainterPath whole = shape.simplified();
        painter.strokePath(whole, QPen(kOutline, 2 * kHeadOutline));
        painter.fillPath(whole, Qt::white);
        painter.setPen(Qt::NoPen);
        painter.setBrush(Theme::forScheme(Scheme::Light).accent); // stands on white in both schemes
        painter.drawEllipse(center, radius - kKnobBorder, radius - kKnobBorder);
    })};
}

std::vector<Sprite> TrimFrameItem::draw(platform::View& view)
{
    assertHere();
    const auto& frame = dynamic_cast<const platform::TrimFrameView&>(view);
    const double grip = platform::TrimFrameView::kGripWidth;
    const QRectF own = ownRect();
    if (own.width() < 2 * grip || own.isEmpty())
        return {};
    const QRectF left(own.left(), own.top(), grip, own.height());
    const QRectF right(own.right() - grip, own.top(), grip, own.height());
    const QRectF leftMark = markIn(left, frame.held() == platform::ScrubberHandle::Start, stage());
    const QRectF rightMark = markIn(right, frame.held() == platform::ScrubberHandle::End, stage());
    if (!frame.isEditing())
        return {
            paintedSprite(left, stage().scale, [&](QPainter& painter) { drawMark(painter, leftMark, kIdleMark); }),
            paintedSprite(right, stage().scale, [&](QPainter& painter) { drawMark(painter, rightMark, kIdleMark); })};
    return {paintedSprite(own, stage().scale, [&](QPainter& painter) {
        QPainterPath outer;
        outer.addRoundedRect(own.adjusted(0, kFrameMargin, 0, -kFrameMargin), kFrameCorner, kFrameCorner);
        QPainterPath inner;
        const double border = kFrameMargin + kFrameBorder;
        inner.addRoundedRect(own.adjusted(grip, border, -grip, -border), kFrameInnerCorner, kFrameInnerCorner);
        const QPainterPath shape = outer.subtracted(inner);
        painter.strokePath(shape, QPen(stage().theme.trimOutline, 2));
        painter.fillPath(shape, stage().theme.trim);
        drawMark(painter, leftMark, stage().theme.trimMark);
        drawMark(painter, rightMark, stage().theme.trimMark);
    })};
}

} // namespace qtui
